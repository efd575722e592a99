#include "client/tool/remote/PlayerStatus.h"

#include <array>
#include <cmath>
#include <cstdio>
#include <tuple>

#include "client/tool/display/Columns.h"
#include "client/tool/display/TimeText.h"

namespace tarn::tool {

namespace {

const char* wordFor(PlayerStatus::State state) {
    static constexpr const char* words[] = {"stopped", "paused", "playing"};
    return words[static_cast<int>(state)];
}

template <std::size_t size = 32>
std::string formatted(const char* format, double number) {
    std::array<char, size> text{};
    std::snprintf(text.data(), text.size(), format, number);
    return text.data();
}

void setText(Dictionary& fields, const char* name, const std::string& text) {
    if (!text.empty())
        fields[name].value = text;
}

} // namespace

bool PlayerStatus::looksLike(const PlayerStatus& other) const {
    const auto shown = [](const PlayerStatus& it) {
        return std::tie(it.state, it.application, it.title, it.artist, it.album, it.trackPath, it.duration,
                        it.rate, it.volume);
    };
    return shown(*this) == shown(other);
}

std::string statusLine(const PlayerStatus& status) {
    if (!status.hasTrack())
        return "Nothing plays.";
    std::string line = status.state == PlayerStatus::State::playing ? "Playing " : "Paused ";
    line += status.title.empty() ? "something without a title" : printable(status.title);
    if (!status.artist.empty())
        line += " - " + printable(status.artist);
    line += " (" + timeText(status.position);
    if (status.duration)
        line += " of " + timeText(*status.duration);
    if (status.rate != 1)
        line += ", " + formatted("%.2fx", status.rate);
    if (std::lround(status.volume * 100) != 100)
        line += ", volume " + formatted("%.0f %%", status.volume * 100);
    return line + ")";
}

Dictionary statusFields(const PlayerStatus& status) {
    Dictionary fields;
    fields["state"].value = std::string(wordFor(status.state));
    if (!status.hasTrack())
        return fields;
    setText(fields, "application", status.application);
    setText(fields, "title", status.title);
    setText(fields, "artist", status.artist);
    setText(fields, "albumTitle", status.album);
    fields["position"].value = status.position;
    if (status.duration)
        fields["duration"].value = *status.duration;
    fields["rate"].value = status.rate;
    fields["volume"].value = status.volume;
    return fields;
}

} // namespace tarn::tool
