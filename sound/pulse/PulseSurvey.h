#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "sound/SoundLibrary.h"

struct pa_context;
struct pa_operation;

namespace tarn {

/// What one look at the server has found.
struct PulseFindings {
    struct Sink {
        std::string name;
        std::string port;                     ///< the active one; empty when it has none
        std::vector<std::string> absentPorts; ///< nothing is plugged in there
        PcmFormat format;
    };

    std::map<std::uint32_t, Sink> sinks;                 ///< by index; without the dummy that stands for none
    std::map<std::uint32_t, std::uint32_t> sinkOfStream; ///< of all streams that play
    bool call = false;                                   ///< a stream of the role "phone" plays or records
};

/// Looks at the server's devices and streams: once when it is asked to, and while it follows them after each
/// change. A look that is asked for during another comes behind it. Player thread.
class PulseSurvey {
public:
    /// `context` outlives the survey. `found` is called inside of the library.
    PulseSurvey(pa_context* context, std::function<void(const PulseFindings&)> found);
    ~PulseSurvey();

    void follow(bool on);
    void look();

    /// The device that servers fall back to when there is none. It is silent.
    static bool isDummy(const char* sinkName);

private:
    struct Callbacks;
    struct OperationDelete {
        void operator()(pa_operation* operation) const;
    };
    using Operation = std::unique_ptr<pa_operation, OperationDelete>;

    void ask();
    void answered();

    pa_context* const context_;
    const std::function<void(const PulseFindings&)> found_;
    PulseFindings findings_;
    std::vector<Operation> questions_; // not answered any more when the survey is gone
    std::size_t unanswered_ = 0;
    bool again_ = false;
};

} // namespace tarn
