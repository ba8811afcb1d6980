#include "platform/Log.h"

#include <atomic>
#include <cstdio>

namespace platform {

namespace {

void writeToStandardError(const char* line)
{
    std::fprintf(stderr, "KTFiles: %s\n", line);
}

std::atomic<LogHandler> currentHandler{writeToStandardError};

} // namespace

LogHandler setLogHandler(LogHandler handler)
{
    return currentHandler.exchange(handler);
}

void logLine(const std::string& line)
{
    if (const LogHandler handler = currentHandler.load())
        handler(line.c_str());
}

} // namespace platform
