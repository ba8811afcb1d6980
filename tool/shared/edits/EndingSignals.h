// Cleans up unfinished files when a signal ends the command.
#pragma once

#include "platform/SignalHold.h"

#include <string>

/// Makes SIGINT, SIGTERM, SIGHUP and similar signals remove this process's temporary files before they end it. Call
/// before making one.
void removeTemporaryFilesAtEndingSignals();

/// Sets a text that such a signal writes to standard error before the end; empty for none.
void sayAtEndingSignals(const std::string& text);

/// A thread is making a temporary file during the lifetime of this object. A signal waits for it; once a signal has
/// arrived, the thread blocks, so that no file is made after the others are removed.
class BeforeTheEnd {
public:
    BeforeTheEnd();
    ~BeforeTheEnd();
    BeforeTheEnd(const BeforeTheEnd&) = delete;
    BeforeTheEnd& operator=(const BeforeTheEnd&) = delete;

private:
    // Otherwise the handler would wait for the thread that it runs in.
    const platform::SignalHold hold_;
};
