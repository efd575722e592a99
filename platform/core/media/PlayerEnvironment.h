#pragma once

#include <mutex>

namespace tarn {

class NotificationCenter;
class OutputFactory;
class PlayerLoop;
class RenderingFactory;

/// What the players and items of one engine share. Outlives all of them.
struct PlayerEnvironment {
    PlayerLoop& loop;
    RenderingFactory& renderings;
    OutputFactory& outputs;
    NotificationCenter& notifications;

    /// Guards the state of every item and player of the engine, so that an item that passes from one player
    /// to another has one truth. Nothing is called out to under it but Output and PlayerLoop::post().
    std::mutex mutex{};
};

} // namespace tarn
