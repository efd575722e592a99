#include "proto/TransportError.h"

#include "proto/MessageRules.h"

namespace tarn {

template class Message<TransportError>;

void TransportError::clearUserInfo() {
    if (userInfo_)
        userInfo_->clear();
}

void TransportError::addUserInfo(std::shared_ptr<TransportEntry> element) {
    if (!userInfo_)
        userInfo_.emplace();
    userInfo_->push_back(std::move(element));
}

} // namespace tarn
