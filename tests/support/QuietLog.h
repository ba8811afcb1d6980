// A test that provokes what the library tells its log.
#pragma once

#include "platform/Log.h"

/// Nothing is logged until it goes out of scope.
class QuietLog {
public:
    QuietLog() : before_(platform::setLogHandler(nullptr)) {}
    ~QuietLog() { platform::setLogHandler(before_); }
    QuietLog(const QuietLog&) = delete;
    QuietLog& operator=(const QuietLog&) = delete;

private:
    platform::LogHandler before_;
};
