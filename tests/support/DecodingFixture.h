#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <memory>

#include "decoder/Examination.h"
#include "decoder/FileDecoder.h"
#include "mediaprocess/FileReader.h"
#include "mediaprotocol/MediaError.h"
#include "tests/support/AudioFixture.h"
#include "tests/support/Samples.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A file that is examined and decoded in the test's own process.
struct DecodedFile {
    explicit DecodedFile(const std::filesystem::path& path)
        : reader({FileDescriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC))}) {
        ExaminedFile examined = examineFile(reader);
        EXPECT_TRUE(examined.info) << path << ": " << examined.error.userInfo[localizedDescriptionKey] << " "
                                   << examined.error.userInfo[localizedFailureReasonKey];
        info = examined.info.value_or(AudioFileInfo{});
        decoder = std::make_unique<FileDecoder>(reader, info);
        const auto error = decoder->open();
        EXPECT_FALSE(error) << path;
    }

    /// Up to `frames` of the frames that follow.
    PcmBuffer read(std::size_t frames) {
        PcmBuffer buffer;
        state = Decoder::State::more;
        while (state == Decoder::State::more && buffer.frames < frames)
            state = decoder->read(buffer, frames - buffer.frames);
        return buffer;
    }

    FileReader reader;
    AudioFileInfo info;
    std::unique_ptr<FileDecoder> decoder;
    Decoder::State state = Decoder::State::more; ///< after the last read()
};

} // namespace tarn
