#include "tests/system/sound/SoundServerProcess.h"

#include <pulse/simple.h>

#include <array>
#include <cstdlib>
#include <stdexcept>

// The sound server's library hands memory between threads by atomic operations that the sanitizer cannot see
// in a library that was built without it.
#ifdef __SANITIZE_THREAD__
extern "C" const char* __tsan_default_suppressions() { // NOLINT(bugprone-reserved-identifier): its name
    return "race:libpulsecommon\n";
}
#endif

namespace tarn {

SoundServerProcess::SoundServerProcess(std::vector<std::string> modules) : modules_(std::move(modules)) {
    for (const std::string& setting : environment()) {
        const std::size_t equals = setting.find('=');
        setenv(setting.substr(0, equals).c_str(), setting.substr(equals + 1).c_str(), 1);
    }
    start();
}

std::vector<std::string> SoundServerProcess::environment() const {
    const std::string path = folder_.path().string();
    return {"PULSE_SERVER=unix:" + path + "/native",
            "XDG_RUNTIME_DIR=" + path,
            "PULSE_RUNTIME_PATH=" + path,
            "PULSE_STATE_PATH=" + path,
            "HOME=" + path,
            "TARND_SOUND="};
}

void SoundServerProcess::start() {
    std::vector<std::string> command{
        "pulseaudio",
        "-n",
        "--daemonize=no",
        "--use-pid-file=no",
        "--exit-idle-time=-1",
        "--disable-shm=no",
        "--log-target=stderr",
        "--log-level=info",
        "-L",
        "module-null-sink sink_name=out norewinds=1 format=s16le rate=44100 channels=2"};
    for (const std::string& module : modules_) {
        command.emplace_back("-L");
        command.push_back(module);
    }
    command.emplace_back("-L");
    command.push_back("module-native-protocol-unix auth-anonymous=1 socket=" + (folder_ / "native").string());
    process_ = std::make_unique<ChildProcess>(command, environment(), ChildProcess::ErrorOutput::withOutput);
    if (!process_->readUntil("Daemon startup complete"))
        throw std::runtime_error("the sound server does not start");
    process_->discardOutput(); // it stops when nobody reads its log
}

void SoundServerProcess::kill() {
    if (!process_)
        return;
    process_->signal(SIGKILL);
    process_->wait();
    process_.reset();
}

std::string SoundServerProcess::control(const std::vector<std::string>& arguments) const {
    std::vector<std::string> command{"pactl"};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return runCommand(command, environment()).output;
}

Recorder::Recorder() : thread_([this] { run(); }) { started_.wait(false); }

Recorder::~Recorder() {
    ending_ = true;
    thread_.join();
}

void Recorder::run() {
    const pa_sample_spec spec{PA_SAMPLE_S16NE, 44100, 2};
    const pa_buffer_attr buffer{static_cast<std::uint32_t>(-1), static_cast<std::uint32_t>(-1),
                                static_cast<std::uint32_t>(-1), static_cast<std::uint32_t>(-1), 1764};
    pa_simple* stream = pa_simple_new(nullptr, "recorder", PA_STREAM_RECORD, "out.monitor", "recorder", &spec,
                                      nullptr, &buffer, nullptr);
    std::array<std::int16_t, 882> piece{};
    while (stream != nullptr && !ending_ &&
           pa_simple_read(stream, piece.data(), sizeof piece, nullptr) >= 0) {
        {
            std::lock_guard lock(mutex_);
            samples_.insert(samples_.end(), piece.begin(), piece.end());
        }
        grown_.notify_all();
        started_ = true;
        started_.notify_one();
    }
    started_ = true;
    started_.notify_one();
    if (stream != nullptr)
        pa_simple_free(stream);
}

std::vector<std::int16_t> Recorder::samples() const {
    std::lock_guard lock(mutex_);
    return samples_;
}

std::size_t Recorder::frames() const {
    std::lock_guard lock(mutex_);
    return samples_.size() / 2;
}

void Recorder::waitFrames(std::size_t frames) const {
    std::unique_lock lock(mutex_);
    const std::size_t target = samples_.size() + 2 * frames;
    grown_.wait_for(lock, std::chrono::seconds(20), [&] { return samples_.size() >= target; });
}

} // namespace tarn
