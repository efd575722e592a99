#include "tests/support/AudioFixture.h"

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <numbers>
#include <random>
#include <stdexcept>

namespace tarn {

namespace {

void put(std::ostream& stream, std::uint32_t value, int bytes) {
    for (int i = 0; i < bytes; ++i)
        stream.put(static_cast<char>(value >> (8 * i)));
}

} // namespace

Recording Recording::part(std::size_t first, std::size_t last) const {
    const auto begin = samples.begin();
    return {rate,
            channels,
            {begin + static_cast<std::ptrdiff_t>(first * channels),
             begin + static_cast<std::ptrdiff_t>(last * channels)}};
}

Recording makeSweep(std::size_t frames, std::uint32_t rate, std::uint32_t channels) {
    Recording recording{rate, channels, {}};
    recording.samples.reserve(frames * channels);
    std::minstd_rand random(1);
    std::uniform_real_distribution<double> noise(-0.02, 0.02);
    for (std::size_t i = 0; i < frames; ++i) {
        const double time = static_cast<double>(i) / rate;
        const double phase = 2 * std::numbers::pi * (200 * time + 150 * time * time);
        for (std::uint32_t channel = 0; channel < channels; ++channel) {
            const double value = 0.4 * std::sin(phase * (channel + 1) / 2) + noise(random);
            recording.samples.push_back(static_cast<std::int16_t>(std::lround(value * 32767)));
        }
    }
    return recording;
}

void writeWav(const std::filesystem::path& path, const Recording& recording) {
    std::ofstream stream(path, std::ios::binary);
    const auto size = static_cast<std::uint32_t>(recording.samples.size() * 2);
    const std::uint32_t frameSize = recording.channels * 2;
    stream << "RIFF";
    put(stream, 36 + size, 4);
    stream << "WAVEfmt ";
    put(stream, 16, 4);
    put(stream, 1, 2);
    put(stream, recording.channels, 2);
    put(stream, recording.rate, 4);
    put(stream, recording.rate * frameSize, 4);
    put(stream, frameSize, 2);
    put(stream, 16, 2);
    stream << "data";
    put(stream, size, 4);
    stream.write(reinterpret_cast<const char*>(recording.samples.data()), size);
}

void encodeAudio(const std::filesystem::path& input, const std::string& arguments,
                 const std::filesystem::path& output) {
    const std::string command = "ffmpeg -nostdin -v error -y -i '" + input.string() + "' -map_metadata -1 " +
                                arguments + " '" + output.string() + "'";
    if (std::system(command.c_str()) != 0) // NOLINT: the command line of a test
        throw std::runtime_error("failed: " + command);
}

std::string fileURL(const std::filesystem::path& path) { return "file://" + path.string(); }

} // namespace tarn
