#include "bench/support/PeakMemory.h"

#include <fstream>

#include "bench/support/ProcFile.h"

namespace tarn {

namespace {

long taken(const char* key) { return numberInProcFile("/proc/self/status", key); }

/// Tells the kernel to begin the peak anew, from what is taken now.
long restartedPeak() {
    constexpr char resetPeak = '5';
    std::ofstream("/proc/self/clear_refs") << resetPeak;
    return taken("VmRSS:");
}

} // namespace

PeakMemory::PeakMemory() : before_(restartedPeak()) {}

long PeakMemory::growth() const { return taken("VmHWM:") - before_; }

long PeakMemory::kept() const { return taken("VmRSS:") - before_; }

} // namespace tarn
