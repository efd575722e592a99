#include "decoder/CodedPcm.h"

#include "decoder/Bytes.h"
#include "decoder/MpegFrame.h"
#include "decoder/WavPromise.h"

namespace tarn {

namespace {

constexpr std::size_t pieceSize = std::size_t{32} * 1024; // more than two frames of any of them
constexpr std::size_t mpegPieceSize = std::size_t{8} * 1024;
constexpr int suspiciousFrames = 3;

// In 16 or 14 bits of each sample, of either byte order.
constexpr std::string_view dtsWords[] = {
    {"\x7F\xFE\x80\x01", 4}, {"\xFE\x7F\x01\x80", 4}, {"\x1F\xFF\xE8\x00", 4}, {"\xFF\x1F\x00\xE8", 4}};
constexpr std::string_view ac3Words[] = {"\x0B\x77", "\x77\x0B"};
constexpr int suspiciousAc3Words = 8; // by chance there is one of them in every other piece

bool mayBeAc3(std::string_view piece) {
    for (const std::string_view word : ac3Words) {
        int count = 0;
        for (std::size_t at = piece.find(word); at != piece.npos; at = piece.find(word, at + 2))
            ++count;
        if (count >= suspiciousAc3Words)
            return true;
    }
    return false;
}

bool mayBeMpeg(std::string_view piece) {
    for (std::size_t at = piece.find('\xFF'); at != piece.npos; at = piece.find('\xFF', at + 1))
        if (readMpegFrames(piece.substr(at)).frames >= suspiciousFrames)
            return true;
    return false;
}

} // namespace

bool mayBeCodedAudio(ByteSource& source) {
    const auto data = findWavData(source);
    const std::string piece = readPiece(source, data ? data->offset : 0, pieceSize);
    const std::string_view view = piece;
    for (const std::string_view word : dtsWords)
        if (view.find(word) != view.npos)
            return true;
    return mayBeAc3(view) || mayBeMpeg(view.substr(0, mpegPieceSize));
}

} // namespace tarn
