// What happens to half-done files when a signal ends the command.
#pragma once

#include "platform/SignalHold.h"

#include <string>

/// From now on SIGINT, SIGTERM, SIGHUP and their like remove the temporary files of this process before they end it.
/// Ahead of making one.
void removeTemporaryFilesAtEndingSignals();

/// From now on such a signal writes the text to standard error, ahead of the end; empty: nothing more.
void sayAtEndingSignals(const std::string& text);

/// For as long as it lives a thread makes a temporary file: a signal waits for that, and when one has come the thread
/// stands still, so that no file is made behind the back of those that are removed.
class BeforeTheEnd {
public:
    BeforeTheEnd();
    ~BeforeTheEnd();
    BeforeTheEnd(const BeforeTheEnd&) = delete;
    BeforeTheEnd& operator=(const BeforeTheEnd&) = delete;

private:
    const platform::SignalHold hold_; // or the handler would wait for the thread that it runs in
};
