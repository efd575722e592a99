#include "decoder/Mp4Atoms.h"

#include <limits>

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::int64_t shortHeader = 8;
constexpr std::int64_t longHeader = 16;
constexpr int mostAtoms = 1'000;

std::optional<Mp4Atom> atomAt(ByteSource& source, std::int64_t begin, std::int64_t limit) {
    const std::string header = readPiece(source, begin, longHeader);
    if (header.size() < shortHeader)
        return std::nullopt;
    const std::string_view view = header;
    Mp4Atom atom{header.substr(4, 4), begin, begin + shortHeader, limit};
    auto size = static_cast<std::int64_t>(bigEndian(view.substr(0, 4)));
    if (size == 0) // up to the end
        return atom;
    if (size == 1 && header.size() == longHeader) {
        size = static_cast<std::int64_t>(bigEndian(view.substr(8, 8)));
        atom.payload = begin + longHeader;
    }
    if (size < atom.payload - begin || size > limit - begin)
        return std::nullopt;
    atom.end = begin + size;
    return atom;
}

// Some writers put a version in front of what is in "meta", others do not.
std::int64_t firstChild(ByteSource& source, const Mp4Atom& atom) {
    const bool versioned = atom.type == "meta" && readPiece(source, atom.payload + 8, 4) == "hdlr";
    return versioned ? atom.payload + 4 : atom.payload;
}

// The number of `atom` that stands behind one or two dates, which take eight bytes each from version 1 on.
std::int64_t afterDates(ByteSource& source, const Mp4Atom& atom, std::int64_t between, std::size_t size) {
    const bool wide = readPiece(source, atom.payload, 1) == "\1";
    const std::int64_t at = atom.payload + 4 + (wide ? 16 : 8) + between;
    const std::string digits = readPiece(source, at, wide ? size : 4);
    return static_cast<std::int64_t>(bigEndian(digits) & std::numeric_limits<std::int64_t>::max());
}

} // namespace

void visitAtoms(ByteSource& source, std::int64_t begin, std::int64_t end,
                const std::function<bool(const Mp4Atom&)>& visit) {
    for (int i = 0; i < mostAtoms && end - begin >= shortHeader; ++i) {
        const auto atom = atomAt(source, begin, end);
        if (!atom || !visit(*atom))
            return;
        begin = atom->end;
    }
}

std::optional<Mp4Atom> findAtom(ByteSource& source, std::initializer_list<std::string_view> path,
                                const std::optional<Mp4Atom>& within) {
    std::optional<Mp4Atom> found = within;
    for (const std::string_view type : path) {
        const std::int64_t begin = found ? firstChild(source, *found) : 0;
        const std::int64_t end = found ? found->end : source.size();
        found.reset();
        visitAtoms(source, begin, end, [&](const Mp4Atom& atom) {
            if (atom.type == type)
                found = atom;
            return !found;
        });
        if (!found)
            return std::nullopt;
    }
    return found;
}

std::optional<std::int64_t> mp4MediaDuration(ByteSource& source, std::int64_t track) {
    std::optional<std::int64_t> duration;
    const auto movie = findAtom(source, {"moov"});
    if (!movie)
        return std::nullopt;
    visitAtoms(source, movie->payload, movie->end, [&](const Mp4Atom& atom) {
        if (atom.type != "trak")
            return true;
        const auto header = findAtom(source, {"tkhd"}, atom);
        if (!header || afterDates(source, *header, 0, 4) != track)
            return true;
        if (const auto media = findAtom(source, {"mdia", "mdhd"}, atom))
            duration = afterDates(source, *media, 4, 8); // its ticks a second stand between
        return false;
    });
    return duration;
}

} // namespace tarn
