// Silences the log for tests that provoke messages.
#pragma once

#include "platform/Log.h"

/// Nothing is logged until the end of its scope.
class QuietLog {
public:
    QuietLog() : before_(platform::setLogHandler(nullptr)) {}
    ~QuietLog() { platform::setLogHandler(before_); }
    QuietLog(const QuietLog&) = delete;
    QuietLog& operator=(const QuietLog&) = delete;

private:
    platform::LogHandler before_;
};
