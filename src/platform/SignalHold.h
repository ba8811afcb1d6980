// Moments in which a signal must not end the process.
#pragma once

#include "platform/core/Export.h"

#include <array>
#include <span>

namespace platform {

/// The numbers of the signals that people and systems end processes with: SIGINT, SIGTERM, SIGHUP and their like.
KT_EXPORT std::span<const int> endingSignals();

/// Holds the ending signals back from the calling thread for as long as it lives; they come then.
class KT_EXPORT SignalHold {
public:
    SignalHold();
    ~SignalHold();
    SignalHold(const SignalHold&) = delete;
    SignalHold& operator=(const SignalHold&) = delete;

private:
    std::array<unsigned long, 16> before_; // the system's set of signals
};

} // namespace platform
