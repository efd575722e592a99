#include "ipc/FrameReader.h"

#include <iterator>
#include <utility>

namespace tarn {

namespace {

/// A buffer that grew beyond this for one big frame is given back.
constexpr std::size_t keptUnfinishedCapacity = 4096;

} // namespace

std::optional<std::string_view> FrameReader::take(std::span<const std::uint8_t> bytes,
                                                  std::vector<ReceivedFile> files,
                                                  std::vector<Frame>& frames) {
    if (broken_)
        return broken_;
    files_.insert(files_.end(), std::make_move_iterator(files.begin()), std::make_move_iterator(files.end()));
    if (unfinished_.empty()) {
        const auto rest = cutFrames(bytes, frames);
        unfinished_.assign(rest.begin(), rest.end());
    } else {
        unfinished_.insert(unfinished_.end(), bytes.begin(), bytes.end());
        const auto rest = cutFrames(unfinished_, frames);
        const auto cut = static_cast<std::ptrdiff_t>(unfinished_.size() - rest.size());
        unfinished_.erase(unfinished_.begin(), unfinished_.begin() + cut);
    }
    if (unfinished_.empty() && unfinished_.capacity() > keptUnfinishedCapacity)
        unfinished_ = {};
    checkLeftOverFiles();
    if (broken_) {
        unfinished_ = {};
        files_.clear();
    }
    return broken_;
}

std::span<const std::uint8_t> FrameReader::cutFrames(std::span<const std::uint8_t> bytes,
                                                     std::vector<Frame>& frames) {
    while (bytes.size() >= FrameHeader::size) {
        const auto header = FrameHeader::decode(bytes.first<FrameHeader::size>());
        if (!header)
            broken_ = "a reserved byte is not zero";
        if (!header || !check(*header))
            return {};
        const std::size_t length = FrameHeader::size + header->bodyLength;
        if (bytes.size() < length)
            break;
        const auto body = bytes.subspan(FrameHeader::size, header->bodyLength);
        Frame frame{header->kind, header->callId, Data(body.begin(), body.end()), {}};
        if (!takeFile(frame))
            return {};
        frames.push_back(std::move(frame));
        bytes = bytes.subspan(length);
    }
    return bytes;
}

bool FrameReader::check(const FrameHeader& header) {
    const bool hasCallId = header.kind == FrameKind::call || header.kind == FrameKind::reply ||
                           header.kind == FrameKind::released;
    if (!mayComeFromSender(header.kind))
        broken_ = "the kind of frame is unknown";
    else if (header.bodyLength > FrameHeader::largestBody)
        broken_ = "the body is too long";
    else if (!hasCallId && header.callId != 0)
        broken_ = "the frame has a call id that its kind does not have";
    return !broken_;
}

bool FrameReader::takeFile(Frame& frame) {
    if (frame.kind != FrameKind::extension)
        return true;
    if (files_.empty()) {
        broken_ = "an extension came without its file";
        return false;
    }
    frame.file = std::move(files_.front());
    files_.pop_front();
    return true;
}

void FrameReader::checkLeftOverFiles() {
    if (broken_ || files_.empty())
        return;
    bool mayBelong = !unfinished_.empty();
    if (unfinished_.size() >= FrameHeader::size) {
        const auto header = FrameHeader::decode(std::span(unfinished_).first<FrameHeader::size>());
        mayBelong = header && header->kind == FrameKind::extension;
    }
    if (!mayBelong || files_.size() > 1)
        broken_ = "a file came where none belongs";
}

bool FrameReader::mayComeFromSender(FrameKind kind) const {
    switch (kind) {
    case FrameKind::call:
    case FrameKind::extension:
        return sender_ == Sender::client;
    case FrameKind::reply:
    case FrameKind::released:
    case FrameKind::event:
    case FrameKind::takenOver:
    case FrameKind::forgotten:
        return sender_ == Sender::service;
    }
    return false;
}

} // namespace tarn
