#include "rendering/BackwardSource.h"

#include <algorithm>

namespace tarn {

void BackwardSource::seek(std::int64_t position) {
    position_ = position;
    left_ = 0;
}

bool BackwardSource::readPiece() {
    const auto frames = std::min<std::int64_t>(position_, format_.rate);
    position_ -= frames;
    piece_.clear();
    forward_.seek(position_);
    if (forward_.read(piece_, static_cast<std::size_t>(frames)) == Decoder::State::failed &&
        piece_.frames == 0)
        return false;
    // Where the file holds less than it promised there is silence.
    piece_.frames = static_cast<std::size_t>(frames);
    piece_.bytes.resize(piece_.frames * format_.bytesPerFrame());
    left_ = piece_.frames;
    return true;
}

Decoder::State BackwardSource::read(PcmBuffer& buffer, std::size_t maxFrames) {
    const std::size_t size = format_.bytesPerFrame();
    for (; maxFrames > 0; --maxFrames) {
        if (left_ == 0 && position_ == 0)
            return Decoder::State::ended;
        if (left_ == 0 && !readPiece())
            return Decoder::State::failed;
        --left_;
        buffer.append(piece_.bytes.data() + left_ * size, 1, size);
    }
    return left_ == 0 && position_ == 0 ? Decoder::State::ended : Decoder::State::more;
}

} // namespace tarn
