#include "client/tool/remote/RemotePlayer.h"

#include <cmath>
#include <cstdint>

#include "client/tool/display/Problem.h"
#include "client/tool/remote/Bus.h"
#include "client/tool/remote/StatusReader.h"

namespace tarn::tool {

namespace {

using namespace std::chrono_literals;

constexpr char usualName[] = "org.mpris.MediaPlayer2.tarnd"; // a further service: this, and ".instance123"
constexpr char rootInterface[] = "org.mpris.MediaPlayer2";
constexpr char playerInterface[] = "org.mpris.MediaPlayer2.Player";
constexpr char propertiesInterface[] = "org.freedesktop.DBus.Properties";

constexpr auto readingLimit = 5s;
constexpr auto commandLimit = 25s; // the sound output may take 17 s to be had

} // namespace

class RemotePlayer::Implementation {
public:
    PlayerStatus status() {
        PlayerStatus best;
        for (const auto& name : bus_.namesBelow(usualName)) {
            const auto properties = ask(name, "GetAll", playerInterface);
            if (!properties)
                continue;
            auto found = readStatus(properties->get());
            if (best.hasTrack() && found.state != PlayerStatus::State::playing)
                continue;
            best = std::move(found);
            name_ = name;
        }
        if (best.hasTrack())
            if (const auto identity = ask(name_, "Get", rootInterface, "Identity"))
                best.application = readText(identity->get());
        return best;
    }

    template <class... Values>
    void call(const char* interface, const char* member, const char* types, Values... values) {
        const auto message = bus_.newCall(name_, interface, member);
        if constexpr (sizeof...(values) > 0)
            requireBus(sd_bus_message_append(message.get(), types, values...));
        if (!bus_.answer(message, commandLimit))
            throw Problem("nothing plays", "Start something: tarnctl play FILE...");
    }

    void watch() {
        const auto match = [this](const std::string& rule) {
            requireBus(sd_bus_add_match(bus_.get(), nullptr, rule.c_str(), noteChange, this));
        };
        match("type='signal',path='/org/mpris/MediaPlayer2'");
        match("type='signal',sender='org.freedesktop.DBus',member='NameOwnerChanged',arg0namespace='" +
              std::string(usualName) + "'");
    }

    bool waitForChange() {
        jumped_ = changed_ = false;
        while (!changed_) {
            const int handled = sd_bus_process(bus_.get(), nullptr);
            requireBus(handled);
            if (handled == 0)
                requireBus(sd_bus_wait(bus_.get(), UINT64_MAX));
        }
        return jumped_;
    }

private:
    template <class... Texts>
    std::optional<MessageHandle> ask(const std::string& name, const char* member, Texts... texts) {
        const auto message = bus_.newCall(name, propertiesInterface, member);
        (requireBus(sd_bus_message_append(message.get(), "s", texts)), ...);
        return bus_.answer(message, readingLimit);
    }

    static int noteChange(sd_bus_message* signal, void* object, sd_bus_error*) {
        auto& self = *static_cast<Implementation*>(object);
        self.changed_ = true;
        self.jumped_ = self.jumped_ || sd_bus_message_is_signal(signal, playerInterface, "Seeked") > 0;
        return 0;
    }

    Bus bus_;
    std::string name_ = usualName;
    bool changed_ = false;
    bool jumped_ = false;
};

RemotePlayer::RemotePlayer() : implementation_(std::make_unique<Implementation>()) {}

RemotePlayer::~RemotePlayer() = default;

PlayerStatus RemotePlayer::status() { return implementation_->status(); }

void RemotePlayer::command(const char* name) { implementation_->call(playerInterface, name, ""); }

void RemotePlayer::moveTo(const std::string& trackPath, double seconds) {
    implementation_->call(playerInterface, "SetPosition", "ox", trackPath.c_str(),
                          std::int64_t{std::llround(seconds * 1e6)});
}

void RemotePlayer::setRate(double rate) {
    implementation_->call(propertiesInterface, "Set", "ssv", playerInterface, "Rate", "d", rate);
}

void RemotePlayer::setVolume(double volume) {
    implementation_->call(propertiesInterface, "Set", "ssv", playerInterface, "Volume", "d", volume);
}

void RemotePlayer::watch() { implementation_->watch(); }

bool RemotePlayer::waitForChange() { return implementation_->waitForChange(); }

} // namespace tarn::tool
