#pragma once

#include <string>
#include <string_view>

#include "decoder/ByteSource.h"
#include "decoder/Container.h"
#include "mediaprotocol/AudioFileInfo.h"

namespace tarn {

/// A tag's text made fit for people: valid UTF-8 (bytes that are not are taken for Latin-1 where all of the
/// text looks like it, else replaced), no control characters, no blank ends, cut to at most 1,024 bytes.
std::string repairTagText(std::string_view raw);

/// Fills in title, album and artist: of several of one kind the first.
void readTags(const Container& container, ByteSource& source, AudioFileInfo& info);

} // namespace tarn
