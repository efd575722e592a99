#pragma once

#include <cstddef>
#include <memory>
#include <string_view>
#include <vector>

#include "proto/Message.h"
#include "proto/VelmoObject.h"

namespace tarn {

/// A list of typed property-list values.
class VLProtoVelmoPlist final : public Message<VLProtoVelmoPlist> {
public:
    static constexpr std::string_view className = "VLProtoVelmoPlist";

    using objectType = VLProtoVelmoObject;
    const std::optional<std::vector<std::shared_ptr<VLProtoVelmoObject>>>& objects() const {
        return objects_;
    }
    void setObjects(std::optional<std::vector<std::shared_ptr<VLProtoVelmoObject>>> list) {
        objects_ = std::move(list);
    }
    void clearObjects() { clearList(objects_); }
    void addObject(std::shared_ptr<VLProtoVelmoObject> element) {
        listCreateIfNeeded(objects_).push_back(std::move(element));
    }
    std::size_t objectsCount() const { return objects_ ? objects_->size() : 0; }
    /// Throws std::out_of_range.
    const std::shared_ptr<VLProtoVelmoObject>& objectAtIndex(std::size_t index) const {
        return elementAt(objects_, index);
    }

    static constexpr auto fields() { return std::tuple{repeated(1, "object", &Self::objects_)}; }

private:
    std::optional<std::vector<std::shared_ptr<VLProtoVelmoObject>>> objects_;
};

extern template class Message<VLProtoVelmoPlist>;

} // namespace tarn
