#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "client/tool/display/Terminal.h"
#include "client/tool/play/PlayDisplay.h"
#include "client/tool/play/Playback.h"
#include "client/tool/play/Signals.h"

namespace tarn::tool {

/// One use of "play": brings together the service, the terminal with its keys, and the signals, in one loop
/// that waits for all of them. Nothing in it waits for the service alone, so that keys and signals are heard
/// whatever the service does.
class PlaySession {
public:
    struct Options {
        std::string socketPath;
        std::vector<std::string> files;
        Playback::Options playback;
        Terminal::KeySource keys = Terminal::KeySource::standardInput;
        bool hasFailedBefore = false; // a file that was named is not there
        /// Are told of what is shown, too. May be empty.
        std::function<void(const Playback&)> changed;
        std::function<void(const std::string& problem)> failed;
    };

    /// Connects. Throws std::system_error when there is no service.
    explicit PlaySession(Options options);

    /// To the end. Returns the exit status.
    int run();

private:
    using Clock = std::chrono::steady_clock;

    void askWhetherTheServiceAnswers();
    void waitForSomething();
    std::chrono::milliseconds longestWait() const;
    void takeSignals();
    void takeKeys();
    void press(Key key);
    void stopHere();
    void takeTerminal();
    void tick();
    void tellOfLongSilence();
    void redraw();
    void draw();
    void end(const std::string& reason, int status);

    const Options options_;
    Terminal terminal_;
    PlayDisplay display_{terminal_};
    Playback playback_;
    client::Client client_; // goes before the rest, which is told of what it ends then
    Signals signals_;       // made after connecting, which can be interrupted as ever

    Clock::time_point answerDue_;   // of the first command
    Clock::time_point questionDue_; // where it plays
    bool hasAnswered_ = false;
    bool silenceTold_ = false;
    bool isForeground_ = false; // and has the keys
    bool keysExplained_ = false;
    bool isDirty_ = false; // the line has to be drawn
    bool keysWait_ = false;
    bool hasEnded_ = false;
    std::string reason_;
    int status_ = 0;
};

} // namespace tarn::tool
