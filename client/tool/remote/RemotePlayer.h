#pragma once

#include <memory>
#include <string>

#include "client/tool/remote/PlayerStatus.h"

namespace tarn::tool {

/// The service as a media player on the session bus. Who controls it there takes nothing over: the program
/// that plays keeps its connection to the service.
///
/// For one thread. Everything waits for the answer, with a limit, and throws Problem when there is no bus, no
/// answer, or nothing that plays.
class RemotePlayer {
public:
    RemotePlayer();
    ~RemotePlayer();
    RemotePlayer(const RemotePlayer&) = delete;
    RemotePlayer& operator=(const RemotePlayer&) = delete;

    /// How it is; `stopped` while no program plays through the service. When several services of this user
    /// run, it is the one that plays, and what follows goes to that one.
    PlayerStatus status();

    /// A command without arguments: "Pause". One that needs the sound output may take some seconds.
    void command(const char* name);
    /// Moves within the track that has this path.
    void moveTo(const std::string& trackPath, double seconds);
    void setRate(double rate);
    void setVolume(double volume);

    /// From now on changes are heard.
    void watch();
    /// Waits until something may have changed since the last wait. Has the position jumped?
    bool waitForChange();

private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn::tool
