#include "decoder/KnownFormat.h"

#include "decoder/Bytes.h"
#include "decoder/Id3.h"
#include "decoder/MpegFrame.h"

namespace tarn {

namespace {

constexpr std::size_t longestSignature = 40;
constexpr std::size_t framesPiece = std::size_t{8} * 1024;
constexpr int convincingFrames = 4;

struct Signature {
    std::size_t offset;
    std::string_view bytes;
    const char* demuxer;
    std::size_t offset2 = 0; // some need a second look
    std::string_view bytes2 = {};
};

constexpr Signature signatures[] = {
    {0, "fLaC", "flac"},
    {0, "OggS", "ogg"},
    {4, "ftyp", "mov"},
    {0, "RIFF", "wav", 8, "WAVE"},
    {0, "RF64", "wav", 8, "WAVE"},
    {0, "riff\x2e\x91\xcf\x11", "w64", 24, "wave"},
    {0, "FORM", "aiff", 8, "AIF"},
    {0, "caff", "caf"},
    {0, "\x1A\x45\xDF\xA3", "matroska"},
    {0, "wvpk", "wv"},
    {0, "TTA1", "tta"},
    {0, "MAC ", "ape"},
    {0, ".snd", "au"},
};

bool fits(const Signature& signature, std::string_view head) {
    return head.substr(signature.offset).starts_with(signature.bytes) &&
           head.substr(signature.offset2).starts_with(signature.bytes2);
}

} // namespace

const AVInputFormat* knownFormat(ByteSource& source) {
    const std::int64_t start = endOfId3Tags(source);
    const std::string head = readPiece(source, start, longestSignature);
    if (head.size() < longestSignature)
        return nullptr;
    for (const Signature& signature : signatures)
        if (fits(signature, head))
            return av_find_input_format(signature.demuxer);
    if (!MpegFrame::parse(head))
        return nullptr;
    const std::string frames = readPiece(source, start, framesPiece);
    if (readMpegFrames(frames).frames < convincingFrames)
        return nullptr;
    return av_find_input_format(MpegFrame::parse(head)->kind == MpegFrame::Kind::adts ? "aac" : "mp3");
}

} // namespace tarn
