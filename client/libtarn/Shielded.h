#pragma once

namespace tarn {

/// Calls what belongs to the program. What it throws is dropped: it must not reach the library, which is in
/// the middle of something, nor end the library's thread and with it the program.
template <class Call>
void shielded(const Call& call) noexcept {
    try {
        call();
    } catch (...) { // NOLINT(bugprone-empty-catch)
    }
}

} // namespace tarn
