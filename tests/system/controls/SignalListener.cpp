#include "tests/system/controls/SignalListener.h"

#include <regex>
#include <stdexcept>

namespace tarn {

namespace {

/// `message` is the bus tool's JSON. What was merely invalidated, which nothing ever is, has no value and
/// shows.
std::string told(const std::string& message) {
    std::smatch found;
    if (std::regex_search(message, found, std::regex(R"re("Seeked".*"data":\[(-?\d+)\])re")))
        return "Seeked " + found[1].str();
    if (message.find("NameOwnerChanged") != std::string::npos)
        return message.ends_with("\"\"]}}") ? "vanished" : "appeared";
    std::string line = message.find("MediaPlayer2.Player") != std::string::npos ? "Player:" : "Root:";
    const std::regex property(R"re("([A-Z]\w+)":\{"type")re");
    for (std::sregex_iterator name(message.begin(), message.end(), property); name != std::sregex_iterator();
         ++name)
        line += " " + (*name)[1].str();
    return message.ends_with("[]]}}") ? line : "Invalidated: " + message;
}

} // namespace

SignalListener::SignalListener(const PrivateBus& bus, const std::string& name)
    : monitor_({"busctl", "--address=" + bus.address(), "--json=short",
                "--match=type='signal',path='/org/mpris/MediaPlayer2'",
                "--match=type='signal',member='NameOwnerChanged',arg0='" + name + "'", "monitor"},
               {}, ChildProcess::ErrorOutput::withOutput) {
    if (!monitor_.readUntil("Monitoring bus"))
        throw std::runtime_error("nothing can be heard on the bus");
}

std::optional<std::string> SignalListener::next(std::chrono::milliseconds limit) {
    const auto message = monitor_.readLine(limit);
    return message ? std::optional(told(*message)) : std::nullopt;
}

std::vector<std::string> SignalListener::until(const std::string& last) {
    std::vector<std::string> lines;
    while (auto line = next()) {
        if (*line == last)
            return lines;
        lines.push_back(std::move(*line));
    }
    lines.push_back("(no \"" + last + "\")");
    return lines;
}

} // namespace tarn
