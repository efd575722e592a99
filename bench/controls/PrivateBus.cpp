#include "bench/controls/PrivateBus.h"

#include <filesystem>
#include <stdexcept>

namespace tarn {

namespace {

constexpr char configuration[] = R"(<busconfig>
  <type>session</type>
  <listen>ADDRESS</listen>
  <policy context="default">
    <allow send_destination="*" eavesdrop="true"/>
    <allow eavesdrop="true"/>
    <allow own="*"/>
  </policy>
</busconfig>
)";

} // namespace

PrivateBus::PrivateBus(State state) : address_("unix:path=" + (folder_ / "run/bus").string()) {
    std::string text = configuration;
    const std::string placeholder = "ADDRESS";
    text.replace(text.find(placeholder), placeholder.size(), address_);
    folder_.write("bus.conf", text);
    if (state == State::running)
        start();
}

void PrivateBus::start() {
    std::filesystem::create_directories(folder_ / "run");
    const std::vector<std::string> command = {"dbus-daemon", "--nofork", "--print-address",
                                              "--config-file=" + (folder_ / "bus.conf").string()};
    daemon_ = std::make_unique<ChildProcess>(command, std::vector<std::string>{},
                                             ChildProcess::ErrorOutput::withOutput);
    if (!daemon_->readUntil(address_))
        throw std::runtime_error("dbus-daemon does not start");
    daemon_->discardOutput();
}

void PrivateBus::kill() { daemon_.reset(); }

} // namespace tarn
