#include "platform/core/WorkerQueues.h"

#include <utility>

#include "platform/core/WorkerQueue.h"

namespace tarn {

std::shared_ptr<SerialQueue> WorkerQueues::create(std::string label) {
    return std::make_shared<WorkerQueue>(pool_, std::move(label));
}

} // namespace tarn
