// What it costs to examine and to open a file, in processor time, for tagged stereo files of 180 s in six
// formats and for two that carry a cover of 10 MB. The peer is FFmpeg as it comes: the file opened by its
// path and its streams looked at, which tells no exact length and no gapless playback. All take turns, and
// the medians are printed.

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <functional>
#include <vector>

#include "decoder/Examination.h"
#include "decoder/FileDecoder.h"

namespace tarn {
namespace {

constexpr int rounds = 60;
constexpr double goal = 0.5; // milliseconds for examining one file, on average

class OpenFile final : public ByteSource {
public:
    explicit OpenFile(const std::filesystem::path& path)
        : descriptor_(::open(path.c_str(), O_RDONLY)), // NOLINT
          size_(static_cast<std::int64_t>(std::filesystem::file_size(path))) {}
    ~OpenFile() override { ::close(descriptor_); }

    std::int64_t size() const override { return size_; }
    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override {
        return pread(descriptor_, into, size, offset);
    }

private:
    const int descriptor_;
    const std::int64_t size_;
};

double millisecondsOf(const std::function<void()>& work) {
    const auto now = [] {
        timespec time{};
        clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
        return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_nsec) / 1e6;
    };
    const double before = now();
    work();
    return now() - before;
}

double median(std::vector<double> values) {
    std::ranges::sort(values);
    return values[values.size() / 2];
}

struct Row {
    std::filesystem::path path;
    std::vector<double> examine, open, peer;

    void measure() {
        OpenFile file(path);
        AudioFileInfo info;
        examine.push_back(millisecondsOf([&] { info = examineFile(file).info.value(); }));
        open.push_back(millisecondsOf([&] {
            FileDecoder decoder(file, info);
            PcmBuffer buffer;
            if (decoder.open() || decoder.read(buffer, 1) == Decoder::State::failed)
                std::abort();
        }));
        peer.push_back(millisecondsOf([&] {
            AVFormatContext* context = nullptr;
            avformat_open_input(&context, path.c_str(), nullptr, nullptr);
            avformat_find_stream_info(context, nullptr);
            avformat_close_input(&context);
        }));
    }
};

std::vector<Row> makeFiles(const std::filesystem::path& folder) {
    const std::string start = "cd " + folder.string() + " && ffmpeg -nostdin -v error -f lavfi -i ";
    const std::string tone =
        start + "sine=440:duration=180 -ac 2 -metadata title=Title -metadata artist=Artist ";
    const std::string cover =
        start + "sine=440:duration=180 -i cover.png -map 0 -map 1 -c:v copy -disposition:v attached_pic ";
    const std::pair<const char*, std::string> files[] = {
        {"cover.png",
         start + "'nullsrc=s=1920x1740,geq=random(1)*255:random(2)*255:random(3)*255' -frames:v 1 "},
        {"a.wav", tone},
        {"a.flac", tone},
        {"a.mp3", tone},
        {"a.m4a", tone},
        {"a.opus", tone},
        {"a.ogg", tone},
        {"cover.mp3", cover},
        {"cover.flac", cover},
        {"cover.m4a", cover},
    };
    std::vector<Row> rows;
    for (const auto& [name, command] : files) {
        if (std::system((command + name).c_str()) != 0) // NOLINT
            std::abort();
        if (std::string(name) != "cover.png")
            rows.push_back({folder / name, {}, {}, {}});
    }
    return rows;
}

int run() {
    std::string folder = (std::filesystem::temp_directory_path() / "tarn-bench-XXXXXX").string();
    if (mkdtemp(folder.data()) == nullptr)
        return 1;
    std::vector<Row> rows = makeFiles(folder);
    for (int round = 0; round < rounds; ++round)
        for (Row& row : rows)
            row.measure();
    double sum = 0;
    std::printf("CPU in ms    examine   open and first frame   FFmpeg alone\n");
    for (const Row& row : rows) {
        if (row.path.stem() == "a")
            sum += median(row.examine) / 6;
        std::printf("%-10s %9.2f %22.2f %14.2f\n", row.path.filename().c_str(), median(row.examine),
                    median(row.open), median(row.peer));
    }
    std::printf("six formats, examined: %.2f ms on average, goal %.1f: %s\n", sum, goal,
                sum <= goal ? "reached" : "MISSED");
    std::filesystem::remove_all(folder);
    return 0;
}

} // namespace
} // namespace tarn

int main() {
    av_log_set_level(AV_LOG_QUIET);
    return tarn::run();
}
