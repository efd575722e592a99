#pragma once

namespace tarn {

class ApplicationRegistry;
class AudioSession;
class Clock;
class Localization;
class MediaEngine;
class NotificationCenter;
class NowPlayingService;
class RemoteCommandCenter;
class SandboxExtension;
class SerialQueues;
class ServiceListeners;

/// Every role that the service needs, as references to what main() or a test has made. "The shared instance"
/// of a role is the one in here. Copied freely; whoever holds a copy keeps it as the first member.
struct Platform {
    Clock& clock;
    SerialQueues& queues;
    ServiceListeners& listeners;
    Localization& localization;
    NotificationCenter& notifications;
    MediaEngine& media;
    AudioSession& audioSession;
    SandboxExtension& sandboxExtensions;
    RemoteCommandCenter& remoteCommands;
    NowPlayingService& nowPlaying;
    ApplicationRegistry& applications;
};

} // namespace tarn
