#include "simulated/SimulatedSpeaker.h"

#include <algorithm>
#include <cstdio>
#include <utility>

#include "simulated/SimulatedOutput.h"

namespace tarn {

namespace {

double seconds(std::chrono::nanoseconds time) { return std::chrono::duration<double>(time).count(); }

/// Does `next` go on where `last` ends, at the same rate?
bool adjoins(const SimulatedSpeaker::Heard& last, const SimulatedSpeaker::Heard& next) {
    if (last.URL != next.URL || last.to != next.from || last.end != next.start)
        return false;
    auto rate = [](const SimulatedSpeaker::Heard& heard) {
        return seconds(heard.end - heard.start) / seconds(heard.to - heard.from);
    };
    return std::abs(rate(last) - rate(next)) < 1e-3;
}

} // namespace

std::string SimulatedSpeaker::Heard::text() const {
    char times[96];
    std::snprintf(times, sizeof times, "%.3f-%.3f ", seconds(from), seconds(to));
    char positions[96];
    std::snprintf(positions, sizeof positions, " %.3f..%.3f", seconds(start), seconds(end));
    return times + URL + positions;
}

std::unique_ptr<Output> SimulatedSpeaker::create(OutputListener& listener) {
    auto output = std::make_unique<SimulatedOutput>(*this, loop_, listener, latency_);
    outputs_.withLocked([&](auto& outputs) { outputs.push_back(output.get()); });
    return output;
}

void SimulatedSpeaker::remove(SimulatedOutput& output) {
    outputs_.withLocked([&](auto& outputs) { std::erase(outputs, &output); });
}

void SimulatedSpeaker::hear(Heard heard) {
    if (!listening_)
        return;
    heard_.withLocked([&](auto& all) {
        if (all.empty() || !adjoins(all.back(), heard)) {
            all.push_back(std::move(heard));
        } else {
            all.back().to = heard.to;
            all.back().end = heard.end;
        }
    });
}

std::vector<SimulatedSpeaker::Heard> SimulatedSpeaker::heard() {
    outputs_.withLocked([](auto& outputs) {
        for (SimulatedOutput* output : outputs)
            output->passOnHeard();
    });
    return heard_.withLocked([](const auto& all) { return all; });
}

void SimulatedSpeaker::reset() {
    loop_.post([this] {
        for (SimulatedOutput* output : outputs_.withLocked([](const auto& outputs) { return outputs; }))
            output->reset();
    });
}

void SimulatedSpeaker::loseDevice() {
    loop_.post([this] {
        for (SimulatedOutput* output : outputs_.withLocked([](const auto& outputs) { return outputs; }))
            output->loseDevice();
    });
}

void SimulatedSpeaker::tellSound(const std::optional<Error>& error) {
    loop_.post([this, error] {
        for (SimulatedOutput* output : outputs_.withLocked([](const auto& outputs) { return outputs; }))
            output->tellSound(error);
    });
}

std::size_t SimulatedSpeaker::outputs() const {
    return outputs_.withLocked([](const auto& outputs) { return outputs.size(); });
}

std::size_t SimulatedSpeaker::soundingOutputs() const {
    return outputs_.withLocked([](const auto& outputs) {
        return static_cast<std::size_t>(
            std::count_if(outputs.begin(), outputs.end(), [](auto* output) { return output->sounding(); }));
    });
}

} // namespace tarn
