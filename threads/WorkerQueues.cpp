#include "threads/WorkerQueues.h"

#include <utility>

#include "threads/WorkerQueue.h"

namespace tarn {

std::shared_ptr<SerialQueue> WorkerQueues::create(std::string label) {
    return std::make_shared<WorkerQueue>(pool_, std::move(label));
}

} // namespace tarn
