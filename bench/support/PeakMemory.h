#pragma once

namespace tarn {

/// How much memory this process takes beyond what it took when this was made, in KiB. One at a time: the
/// kernel keeps one peak for each process.
class PeakMemory {
public:
    PeakMemory();

    /// The most that it was since then.
    long growth() const;

    /// What is still there.
    long kept() const;

private:
    const long before_;
};

} // namespace tarn
