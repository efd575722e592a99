#include "mediaprocess/Renderer.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "decoder/FileDecoder.h"
#include "mediaprocess/FileReader.h"
#include "mediaprotocol/Parking.h"
#include "rendering/ItemRendering.h"

namespace tarn {

namespace {

constexpr std::size_t piecesASecond = 8;

}

Renderer::Renderer(Channel service, RingMemory ring, std::uint32_t locks)
    : service_(std::move(service)), locks_(locks), ring_(std::move(ring)) {}

Renderer::~Renderer() = default;

void Renderer::run() {
    ReceivedMessage message;
    for (;;) {
        const Channel::Result result =
            hasWork() ? service_.receiveNow(message, 1) : service_.receive(message, 1);
        if (result == Channel::Result::done ? !serve(message)
                                            : result != Channel::Result::notNow || !renderPiece())
            return;
    }
}

bool Renderer::hasWork() const { return goesOn_ && ring_.room() > 0; }

bool Renderer::serve(ReceivedMessage& message) {
    if (const auto request = message.as<Seek>())
        return seek(*request);
    if (const auto request = message.as<OpenItem>())
        return open(*request, message.takeFile());
    return message.as<Taken>().has_value(); // there is room: the ring tells how much
}

bool Renderer::open(const OpenItem& request, FileDescriptor file) {
    const auto info = request.info.checked();
    if (!info || decoder_)
        return false;
    reader_ = std::make_unique<FileReader>(request.form == FileForm::parked ? takeParked(file.get())
                                                                            : ParkedFile{std::move(file)});
    decoder_ = std::make_unique<FileDecoder>(*reader_, *info);
    ItemOpened answer;
    answer.locks = locks_;
    if (const auto error = decoder_->open())
        answer.error = ErrorRecord::of(*error);
    rendering_ = std::make_unique<ItemRendering>(*decoder_, *info);
    return service_.send(answer) == Channel::Result::done;
}

bool Renderer::seek(const Seek& request) {
    const auto format = request.format.checked();
    const auto rate = std::bit_cast<float>(request.rate);
    const bool isPossible = std::isfinite(rate) && rate != 0 && MediaSpan::isTime(request.position);
    if (!rendering_ || !format || !isPossible || !ring_.begin(*format, request.capacity))
        return false;
    generation_ = request.generation;
    pieceFrames_ = format->rate / piecesASecond;
    rendering_->seek(std::chrono::nanoseconds(request.position), rate, *format);
    goesOn_ = true;
    return true;
}

bool Renderer::renderPiece() {
    piece_.clear();
    MediaSpan span = rendering_->render(piece_, std::min(pieceFrames_, ring_.room()));
    span.generation = generation_;
    goesOn_ = span.state == MediaSpan::State::more;
    if (span.state == MediaSpan::State::failed) {
        RenderingFailed reason;
        reason.generation = generation_;
        reason.error = ErrorRecord::of(rendering_->error());
        static_cast<void>(service_.send(reason));
    }
    ring_.put(piece_, span);
    return !ring_.owesWord() || service_.send(More{}) == Channel::Result::done;
}

} // namespace tarn
