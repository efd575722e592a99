#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace tarn {

/// Interleaved 16-bit samples.
struct Recording {
    std::uint32_t rate = 44100;
    std::uint32_t channels = 2;
    std::vector<std::int16_t> samples;

    std::size_t frames() const { return samples.size() / channels; }

    /// Frames [first, last).
    Recording part(std::size_t first, std::size_t last) const;
};

/// A tone that sweeps upwards for ever, with a little noise: no two places of it are alike. Left and right
/// differ.
Recording makeSweep(std::size_t frames, std::uint32_t rate, std::uint32_t channels);

/// A WAV file.
void writeWav(const std::filesystem::path& path, const Recording& recording);

/// Runs `ffmpeg` on `input` with `arguments` before the output's name. Throws when it fails.
void encodeAudio(const std::filesystem::path& input, const std::string& arguments,
                 const std::filesystem::path& output);

/// A file as a URL.
std::string fileURL(const std::filesystem::path& path);

} // namespace tarn
