#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// What the client knows of an audio file, and in the answer what the file itself tells. Durations in
/// seconds.
class VLProtoAudioFilePlayerAssetUpdateMetaData final
    : public Message<VLProtoAudioFilePlayerAssetUpdateMetaData> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerAssetUpdateMetaData";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    const std::optional<std::string>& uRL() const { return url_; }
    void setURL(std::optional<std::string> value) { url_ = std::move(value); }
    bool hasURL() const { return url_.has_value(); }

    double duration() const { return duration_; }
    void setDuration(double value) { setFlagged(3, duration_, value); }
    bool hasDuration() const { return presence_[3]; }
    void setHasDuration(bool present) { presence_.set(3, present); }

    const std::optional<std::string>& title() const { return title_; }
    void setTitle(std::optional<std::string> value) { title_ = std::move(value); }
    bool hasTitle() const { return title_.has_value(); }

    const std::optional<std::string>& albumTitle() const { return albumTitle_; }
    void setAlbumTitle(std::optional<std::string> value) { albumTitle_ = std::move(value); }
    bool hasAlbumTitle() const { return albumTitle_.has_value(); }

    const std::optional<std::string>& artist() const { return artist_; }
    void setArtist(std::optional<std::string> value) { artist_ = std::move(value); }
    bool hasArtist() const { return artist_.has_value(); }

    const std::optional<std::string>& sandboxExtensionToken() const { return sandboxExtensionToken_; }
    void setSandboxExtensionToken(std::optional<std::string> value) {
        sandboxExtensionToken_ = std::move(value);
    }
    bool hasSandboxExtensionToken() const { return sandboxExtensionToken_.has_value(); }

    static constexpr auto fields() {
        return std::tuple{required(1, "identifier", &Self::identifier_),
                          optional(2, "URL", &Self::url_),
                          optional(3, "duration", &Self::duration_),
                          optional(4, "title", &Self::title_),
                          optional(5, "albumTitle", &Self::albumTitle_),
                          optional(6, "artist", &Self::artist_),
                          optional(7, "sandboxExtensionToken", &Self::sandboxExtensionToken_)};
    }

private:
    std::optional<std::string> identifier_;
    std::optional<std::string> url_;
    double duration_ = 0;
    std::optional<std::string> title_;
    std::optional<std::string> albumTitle_;
    std::optional<std::string> artist_;
    std::optional<std::string> sandboxExtensionToken_;
};

extern template class Message<VLProtoAudioFilePlayerAssetUpdateMetaData>;

} // namespace tarn
