#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"
#include "roles/Data.h"

namespace tarn {

class MediaItem;
class MediaQueuePlayer;
struct Error;
enum class MediaStatus : std::int32_t;

/// Status of a player item or queue player (0 unknown, 1 ready to play, 2 failed), with the error that
/// explains a failure. `errorDict` is a binary property list of the error's texts.
class VLProtoAudioFilePlayerStatus final : public Message<VLProtoAudioFilePlayerStatus> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerStatus";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }
    bool hasIdentifier() const { return identifier_.has_value(); }

    std::int32_t status() const { return status_; }
    void setStatus(std::int32_t value) { setFlagged(2, status_, value); }
    bool hasStatus() const { return presence_[2]; }
    void setHasStatus(bool present) { presence_.set(2, present); }

    const std::optional<std::string>& errorDomain() const { return errorDomain_; }
    void setErrorDomain(std::optional<std::string> value) { errorDomain_ = std::move(value); }
    bool hasErrorDomain() const { return errorDomain_.has_value(); }

    std::int64_t errorCode() const { return errorCode_; }
    void setErrorCode(std::int64_t value) { setFlagged(4, errorCode_, value); }
    bool hasErrorCode() const { return presence_[4]; }
    void setHasErrorCode(bool present) { presence_.set(4, present); }

    const std::optional<Data>& errorDict() const { return errorDict_; }
    void setErrorDict(std::optional<Data> value) { errorDict_ = std::move(value); }
    bool hasErrorDict() const { return errorDict_.has_value(); }

    /// What the item reports now: its status, and its error when it has one.
    static std::shared_ptr<VLProtoAudioFilePlayerStatus>
    statusMessageFromPlayerItem(const MediaItem& playerItem, std::optional<std::string> identifier);

    /// What the queue player reports now: its status, and its error when it has one.
    static std::shared_ptr<VLProtoAudioFilePlayerStatus>
    statusMessageFromPlayer(const MediaQueuePlayer& player, std::optional<std::string> identifier);

    static constexpr auto fields() {
        return std::tuple{
            optional(1, "identifier", &Self::identifier_), optional(2, "status", &Self::status_),
            optional(3, "errorDomain", &Self::errorDomain_), optional(4, "errorCode", &Self::errorCode_),
            optional(5, "errorDict", &Self::errorDict_)};
    }

private:
    static std::shared_ptr<VLProtoAudioFilePlayerStatus>
    _statusMessageStatus(MediaStatus status, const std::optional<Error>& error,
                         std::optional<std::string> identifier);

    std::optional<std::string> identifier_;
    std::int32_t status_ = 0;
    std::optional<std::string> errorDomain_;
    std::int64_t errorCode_ = 0;
    std::optional<Data> errorDict_;
};

extern template class Message<VLProtoAudioFilePlayerStatus>;

} // namespace tarn
