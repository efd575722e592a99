#include "client/tool/display/LiveLine.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>

#include "client/tool/display/Columns.h"
#include "client/tool/display/TimeText.h"

namespace tarn::tool {

namespace {

constexpr int shortestBar = 8;
constexpr int longestBar = 40;
constexpr int shortestTitle = 10;

std::string colored(const std::string& text, const char* code, bool color) {
    return color ? std::string("\x1b[") + code + "m" + text + "\x1b[0m" : text;
}

std::string rateText(float rate) {
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), " %.2fx", static_cast<double>(rate));
    return rate == 1.0F ? "" : text.data();
}

std::string barText(double position, double duration, int columns) {
    const int inner = columns - 3; // a blank and two brackets
    const double share = duration > 0 ? std::clamp(position / duration, 0.0, 1.0) : 0.0;
    const int done = static_cast<int>(std::floor(share * inner));
    return " [" + std::string(static_cast<std::size_t>(done), '=') +
           std::string(static_cast<std::size_t>(inner - done), ' ') + "]";
}

} // namespace

std::string liveLine(const LiveState& state, int columns, bool color) {
    const std::string mark = state.isPaused ? "|| " : state.rate < 0 ? "<< " : "> ";
    const std::string times = " " + timeText(state.position) + " / " + timeText(state.duration);
    const std::string rate = rateText(state.rate);
    const int fixed = columnsOf(mark) + columnsOf(times) + columnsOf(rate);
    int room = columns - 1 - fixed;
    if (room < shortestTitle)
        return fitColumns(mark + timeText(state.position), columns - 1);

    std::string place = state.place.empty() ? "" : state.place + " ";
    if (room - columnsOf(place) < shortestTitle)
        place.clear();
    room -= columnsOf(place);
    std::string name = state.title;
    if (!state.artist.empty() && columnsOf(name) + columnsOf(state.artist) + 3 <= room)
        name += " - " + state.artist;
    name = fitColumns(name, room);
    room -= columnsOf(name);
    const int bar = std::min(room, longestBar);
    return mark + place + colored(name, "1", color) + times +
           (bar >= shortestBar ? colored(barText(state.position, state.duration, bar), "36", color) : "") +
           rate;
}

} // namespace tarn::tool
