#include "client/tool/LineMode.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <condition_variable>
#include <cstring>
#include <deque>
#include <iostream>
#include <mutex>
#include <stdexcept>

#include <tarn/Connection.h>

#include "client/tool/Command.h"
#include "system/FileDescriptor.h"

namespace tarn::tool {

namespace {

/// Events that may wait for a `wait`; the oldest gives way.
constexpr std::size_t mostEvents = 4'096;

class LineMode {
public:
    explicit LineMode(const LineModeOptions& options)
        : options_(options),
          connection_({[this](const Data& envelope) { takeEvent(envelope); }, [this] { takeLoss(); }},
                      options.socketPath) {}

    void run(const std::string& line) {
        try {
            const auto words = splitLine(line);
            if (words.empty() || words[0].starts_with('#'))
                return;
            if (words[0] == "wait" && words.size() == 1)
                waitForAnswers();
            else if (words[0] == "wait")
                waitForEvent(words);
            else if (words[0] == "grant")
                grant(words);
            else
                send(words);
        } catch (const std::exception& problem) {
            fail(problem.what());
        }
    }

    void waitForAnswers() {
        std::unique_lock lock(mutex_);
        changed_.wait(lock, [this] { return pending_ == 0; });
    }

    void waitForLoss() {
        std::unique_lock lock(mutex_);
        changed_.wait(lock, [this] { return lost_; });
    }

    bool failed() {
        std::lock_guard lock(mutex_);
        return failed_;
    }

private:
    void send(const std::vector<std::string>& words) {
        const auto envelope = encodeCommand(words);
        std::int64_t call = 0;
        {
            std::lock_guard lock(mutex_);
            call = ++lastCall_;
            ++pending_;
        }
        connection_.call(envelope, [this, call, command = words[0]](const client::Answer& answer) {
            takeAnswer(call, command, answer);
        });
    }

    void grant(const std::vector<std::string>& words) {
        if (words.size() != 3 || !words[1].starts_with("token=") || !words[2].starts_with("path="))
            throw std::invalid_argument("usage: grant token=TOKEN path=PATH");
        const auto path = words[2].substr(5);
        const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
        if (!file)
            throw std::invalid_argument(path + ": " + std::strerror(errno));
        if (!connection_.grant(words[1].substr(6), path, file.get()))
            throw std::runtime_error("there is no connection to hand the file over");
    }

    /// An event that came since the last wait counts.
    void waitForEvent(const std::vector<std::string>& words) {
        std::unique_lock lock(mutex_);
        while (true) {
            changed_.wait(lock, [this] { return !events_.empty() || lost_; });
            if (events_.empty())
                throw std::runtime_error("the connection was lost before " + words[1]);
            const auto event = std::move(events_.front());
            events_.pop_front();
            if (matches(event, words))
                return;
        }
    }

    static bool matches(const NamedMessage& event, const std::vector<std::string>& words) {
        return event.name == words[1] && std::all_of(words.begin() + 2, words.end(), [&](const auto& word) {
                   const auto equals = std::min(word.find('='), word.size());
                   const auto field = event.fields.find(word.substr(0, equals));
                   return field != event.fields.end() &&
                          plainText(field->second) == word.substr(std::min(equals + 1, word.size()));
               });
    }

    void takeAnswer(std::int64_t call, const std::string& command, const client::Answer& answer) {
        static constexpr const char* types[] = {"answer", "failed", "released", "lost"};
        Dictionary fields;
        if (answer.data)
            fields = decodeAnswer(command, *answer.data);
        if (answer.outcome == client::Outcome::failed) {
            fields["domain"].value = answer.error.domain;
            fields["code"].value = answer.error.code;
            for (const auto& [key, text] : answer.error.texts)
                fields[key].value = text;
        }
        fields["call"].value = call;
        fields["command"].value = command;
        std::lock_guard lock(mutex_);
        print(types[static_cast<int>(answer.outcome)], fields);
        failed_ = failed_ || answer.outcome == client::Outcome::failed ||
                  answer.outcome == client::Outcome::connectionLost;
        --pending_;
        changed_.notify_all();
    }

    void takeEvent(const Data& envelope) {
        auto event = decodeEnvelope(envelope);
        auto fields = event.fields;
        fields["event"].value = event.name;
        std::lock_guard lock(mutex_);
        print("event", fields);
        events_.push_back(std::move(event));
        if (events_.size() > mostEvents)
            events_.pop_front();
        changed_.notify_all();
    }

    void takeLoss() {
        std::lock_guard lock(mutex_);
        print("connectionLost", {});
        lost_ = true;
        changed_.notify_all();
    }

    void print(std::string_view type, const Dictionary& fields) const {
        std::cout << outputLine(options_.format, type, fields) << std::endl; // for whoever reads along
    }

    void fail(const std::string& problem) {
        std::lock_guard lock(mutex_);
        std::cerr << "tarnctl: " << problem << "\n";
        failed_ = true;
    }

    const LineModeOptions& options_;
    std::mutex mutex_; // guards the rest but the connection, and the output
    std::condition_variable changed_;
    std::deque<NamedMessage> events_; // not waited for yet
    std::int64_t lastCall_ = 0;
    int pending_ = 0;
    bool lost_ = false;
    bool failed_ = false;
    client::Connection connection_; // goes first: its thread uses the rest
};

} // namespace

int runLineMode(const LineModeOptions& options) {
    LineMode mode(options);
    for (const auto& line : options.lines)
        mode.run(line);
    if (options.lines.empty())
        for (std::string line; std::getline(std::cin, line);)
            mode.run(line);
    mode.waitForAnswers();
    if (options.follow)
        mode.waitForLoss();
    return mode.failed() ? 1 : 0;
}

} // namespace tarn::tool
