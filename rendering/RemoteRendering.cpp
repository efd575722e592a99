#include "rendering/RemoteRendering.h"

#include <algorithm>
#include <cmath>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <utility>

#include "media/DeadlineCall.h"
#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
using std::chrono::nanoseconds;

constexpr std::size_t piecesASecond = 8;
constexpr std::size_t piecesAhead = 8;

} // namespace

/// What the rendering and its thread share. The thread holds it as long as its last call takes.
class RemoteRendering::Worker : public std::enable_shared_from_this<Worker> {
public:
    struct Target {
        nanoseconds position;
        float rate;
        PcmFormat format;
    };
    struct Hold {
        Opening opening;
        std::optional<nanoseconds> busySince; ///< when the call in progress began
    };

    Worker(EventLoop& loop, std::function<void()> goesOn)
        : loop_(loop), goesOn_(std::move(goesOn)), busySince_(loop.now()) {}

    /// All that the thread does.
    void run(const std::function<RenderingFactory::Outcome()>& open);

    // Player thread.
    void close();
    void seek(const Target& target);

    /// Appends what was rendered ahead; none when there is nothing, and then goesOn is called when there is.
    std::optional<RenderedSpan> take(PcmBuffer& buffer, std::size_t maxFrames);

    Hold hold() {
        std::lock_guard lock(mutex_);
        return {opening_, busySince_};
    }

private:
    struct Piece {
        PcmBuffer buffer;
        std::size_t taken = 0; // frames
        RenderedSpan span;     // of those that were not taken
    };

    static RenderedSpan takeFrom(Piece& piece, PcmBuffer& buffer, std::size_t maxFrames);
    bool hasWork() const;
    void work(std::unique_lock<std::mutex>& lock, Rendering& rendering);
    void tell();

    EventLoop& loop_; // may be gone when closed_
    const std::function<void()> goesOn_;

    std::mutex mutex_;
    std::condition_variable changed_;
    bool closed_ = false;
    std::optional<Target> target_; // not taken up yet
    std::optional<PcmFormat> format_;
    std::deque<Piece> pieces_;
    bool filling_ = true;   // until there are enough of them
    bool complete_ = false; // nothing follows them
    bool wanted_ = false;   // the player waits for the next one
    Opening opening_{.done = false, .error = std::nullopt};
    std::optional<nanoseconds> busySince_;
};

void RemoteRendering::Worker::run(const std::function<RenderingFactory::Outcome()>& open) {
    const RenderingFactory::Outcome outcome = open(); // goes on this thread too, which may take its time
    std::unique_lock lock(mutex_);
    opening_.done = true;
    if (!outcome.rendering)
        opening_.error = outcome.error.value_or(Error{});
    tell();
    if (opening_.error)
        return;
    for (;;) {
        busySince_.reset();
        changed_.wait(lock, [this] { return closed_ || hasWork(); });
        if (closed_)
            return;
        work(lock, *outcome.rendering);
    }
}

bool RemoteRendering::Worker::hasWork() const {
    const std::size_t enough = filling_ ? piecesAhead : piecesAhead / 2;
    return target_ || (format_ && !complete_ && pieces_.size() < enough);
}

// The lock is let go meanwhile.
void RemoteRendering::Worker::work(std::unique_lock<std::mutex>& lock, Rendering& rendering) {
    const std::optional<Target> target = std::exchange(target_, std::nullopt);
    const std::size_t frames = format_->rate / piecesASecond;
    busySince_ = loop_.now();
    lock.unlock();
    Piece piece;
    if (target)
        rendering.seek(target->position, target->rate, target->format);
    piece.span = rendering.render(piece.buffer, frames);
    lock.lock();
    if (target_) // what was made is of no use any more
        return;
    complete_ = piece.span.state != RenderedSpan::State::more;
    pieces_.push_back(std::move(piece));
    filling_ = pieces_.size() < piecesAhead;
    if (wanted_)
        tell();
}

void RemoteRendering::Worker::tell() {
    if (closed_)
        return;
    loop_.post([weak = weak_from_this()] {
        const auto self = weak.lock();
        if (!self)
            return;
        {
            std::lock_guard lock(self->mutex_);
            if (self->closed_)
                return;
        }
        self->goesOn_();
    });
}

void RemoteRendering::Worker::close() {
    std::lock_guard lock(mutex_);
    closed_ = true;
    changed_.notify_one();
}

void RemoteRendering::Worker::seek(const Target& target) {
    std::lock_guard lock(mutex_);
    target_ = target;
    format_ = target.format;
    pieces_.clear();
    filling_ = true;
    complete_ = false;
    changed_.notify_one();
}

std::optional<RenderedSpan> RemoteRendering::Worker::take(PcmBuffer& buffer, std::size_t maxFrames) {
    std::lock_guard lock(mutex_);
    wanted_ = pieces_.empty();
    if (wanted_)
        return std::nullopt;
    Piece& first = pieces_.front();
    RenderedSpan span = takeFrom(first, buffer, maxFrames);
    if (first.taken == first.buffer.frames)
        pieces_.pop_front();
    if (pieces_.size() < piecesAhead / 2)
        changed_.notify_one();
    return span;
}

RenderedSpan RemoteRendering::Worker::takeFrom(Piece& piece, PcmBuffer& buffer, std::size_t maxFrames) {
    const std::size_t left = piece.buffer.frames - piece.taken;
    const std::size_t count = std::min(left, maxFrames);
    RenderedSpan span = piece.span;
    if (count < left) {
        const auto share = static_cast<double>(count) / static_cast<double>(left);
        span.end = span.start +
                   nanoseconds(std::llround(share * static_cast<double>((span.end - span.start).count())));
        span.state = RenderedSpan::State::more;
        span.error.reset();
        piece.span.start = span.end;
    }
    span.frames = count;
    if (count > 0) {
        const std::size_t size = piece.buffer.bytes.size() / piece.buffer.frames;
        buffer.append(piece.buffer.bytes.data() + piece.taken * size, count, size);
        piece.taken += count;
    }
    return span;
}

std::unique_ptr<RemoteRendering> RemoteRendering::create(EventLoop& loop,
                                                         std::function<RenderingFactory::Outcome()> open,
                                                         std::function<void()> goesOn, Options options) {
    const auto worker = std::make_shared<Worker>(loop, goesOn);
    if (!startDetached([worker, open = std::move(open)] { worker->run(open); }))
        return nullptr;
    return std::unique_ptr<RemoteRendering>(new RemoteRendering(loop, worker, std::move(goesOn), options));
}

RemoteRendering::RemoteRendering(EventLoop& loop, std::shared_ptr<Worker> worker,
                                 std::function<void()> goesOn, Options options)
    : loop_(loop), goesOn_(std::move(goesOn)), options_(options), worker_(std::move(worker)) {}

RemoteRendering::~RemoteRendering() { worker_->close(); }

Opening RemoteRendering::opening() const { return worker_->hold().opening; }

void RemoteRendering::seek(nanoseconds position, float rate, const PcmFormat& format) {
    position_ = std::clamp(position, 0ns, options_.length.value_or(nanoseconds::max()));
    worker_->seek({position_, rate, format});
}

RenderedSpan RemoteRendering::render(PcmBuffer& buffer, std::size_t maxFrames) {
    alarm_.reset();
    if (auto span = worker_->take(buffer, maxFrames)) {
        position_ = span->end;
        return *std::move(span);
    }
    RenderedSpan nothing;
    nothing.start = position_;
    nothing.end = position_;
    const Worker::Hold hold = worker_->hold();
    const nanoseconds now = loop_.now();
    const nanoseconds late = hold.busySince.value_or(now) + options_.limit;
    if (hold.opening.error || now >= late) {
        nothing.state = RenderedSpan::State::failed;
        nothing.error = hold.opening.error.value_or(
            mediaError(MediaErrorCode::timedOut, "The file did not answer in time."));
    } else {
        nothing.state = RenderedSpan::State::waiting;
        alarm_ = loop_.at(late, goesOn_);
    }
    return nothing;
}

} // namespace tarn
