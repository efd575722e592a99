#pragma once

#include <memory>
#include <string_view>

#include "proto/AudioFilePlayerAssetUpdateMetaData.h"
#include "proto/Message.h"
#include "proto/ObjectMessage.h"

namespace tarn {

/// A command about an asset: the field that is set names it.
class VLProtoAudioFilePlayerAsset final : public Message<VLProtoAudioFilePlayerAsset> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerAsset";

    const std::shared_ptr<VLProtoAudioFilePlayerAssetUpdateMetaData>& upsertWithMetaData() const {
        return upsertWithMetaData_;
    }
    void setUpsertWithMetaData(std::shared_ptr<VLProtoAudioFilePlayerAssetUpdateMetaData> message) {
        upsertWithMetaData_ = std::move(message);
    }
    bool hasUpsertWithMetaData() const { return upsertWithMetaData_ != nullptr; }

    const std::shared_ptr<VLProtoObjectMessage>& destroy() const { return destroy_; }
    void setDestroy(std::shared_ptr<VLProtoObjectMessage> message) { destroy_ = std::move(message); }
    bool hasDestroy() const { return destroy_ != nullptr; }

    static constexpr auto fields() {
        return std::tuple{optional(1, "upsertWithMetaData", &Self::upsertWithMetaData_),
                          optional(2, "destroy", &Self::destroy_)};
    }

private:
    std::shared_ptr<VLProtoAudioFilePlayerAssetUpdateMetaData> upsertWithMetaData_;
    std::shared_ptr<VLProtoObjectMessage> destroy_;
};

extern template class Message<VLProtoAudioFilePlayerAsset>;

} // namespace tarn
