// Moments in which a signal must not end the process.
#pragma once

#include "platform/core/Export.h"

#include <array>
#include <span>

namespace platform {

/// The signals by which people and systems end processes: SIGINT, SIGTERM, SIGHUP and their like.
KT_EXPORT std::span<const int> endingSignals();

/// Holds the ending signals back from the calling thread for as long as it lives; pending ones arrive then.
class KT_EXPORT SignalHold {
public:
    /// Blocks the signals.
    SignalHold();
    ~SignalHold();
    SignalHold(const SignalHold&) = delete;
    SignalHold& operator=(const SignalHold&) = delete;

private:
    std::array<unsigned long, 16> before_; // the system's set of signals
};

} // namespace platform
