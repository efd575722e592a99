#include "tests/system/controls/PrivateBus.h"

#include <filesystem>
#include <stdexcept>

namespace tarn {

namespace {

constexpr char configuration[] = R"(<busconfig>
  <type>session</type>
  <policy context="default"><allow send_destination="*" eavesdrop="true"/><allow eavesdrop="true"/><allow own="*"/></policy>
  <listen>)";

} // namespace

PrivateBus::PrivateBus(State state) : address_("unix:path=" + (folder_ / "run/bus").string()) {
    folder_.write("bus.conf", configuration + address_ + "</listen></busconfig>");
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

std::vector<std::string> PrivateBus::calling(std::vector<std::string> method) const {
    method.insert(method.begin(),
                  {"busctl", "--address=" + address_, "--", "call", "org.mpris.MediaPlayer2.tarnd",
                   "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2.Player"});
    return method;
}

std::string PrivateBus::property(const std::string& name, const std::string& interface) const {
    std::string text = run("get-property", interface, {name});
    return text.substr(0, text.find('\n'));
}

std::string PrivateBus::set(const std::string& name, const std::string& type,
                            const std::string& value) const {
    return run("set-property", ".Player", {name, type, value});
}

std::string PrivateBus::run(const std::string& verb, const std::string& interface,
                            std::vector<std::string> rest) const {
    rest.insert(rest.begin(), {"busctl", "--address=" + address_, verb, "org.mpris.MediaPlayer2.tarnd",
                               "/org/mpris/MediaPlayer2", "org.mpris.MediaPlayer2" + interface});
    return runCommand(rest).output;
}

CommandResult PrivateBus::playerctl(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), {"playerctl", "--player=tarnd"});
    return runCommand(arguments, {environment()});
}

} // namespace tarn
