#include "proto/VelmoPlist.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<VLProtoVelmoPlist>;

void VLProtoVelmoPlist::clearObjects() {
    if (objects_)
        objects_->clear();
}

void VLProtoVelmoPlist::addObject(std::shared_ptr<VLProtoVelmoObject> element) {
    if (!objects_)
        objects_.emplace();
    objects_->push_back(std::move(element));
}

} // namespace tarn
