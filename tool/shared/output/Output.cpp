#include "tool/shared/output/Output.h"

#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ProgressLine.h"

#include <cerrno>
#include <poll.h>
#include <unistd.h>

Form outputForm(const OutputOptions& options)
{
    if (options.wantsJson())
        return Form::json;
    if (options.csv)
        return Form::csv;
    if (options.quiet)
        return Form::none;
    return isTerminal(STDOUT_FILENO) || options.color == ColorMode::always ? Form::table : Form::lines;
}

Output& Output::standard()
{
    static Output output;
    return output;
}

void Output::write(std::string_view bytes)
{
    if (buffer().size() + bytes.size() >= kFlushSize) {
        flush();
        writeThrough(bytes);
    } else {
        buffer().append(bytes);
    }
}

bool Output::flush()
{
    writeThrough(buffer().view());
    buffer().clear();
    return !failed();
}

void Output::writeThrough(std::string_view bytes)
{
    static const bool onTerminal = isTerminal(STDOUT_FILENO);
    std::optional<progressline::Cleared> cleared;
    if (onTerminal && !bytes.empty())
        cleared.emplace();
    while (!bytes.empty() && !failed()) {
        const ssize_t written = ::write(STDOUT_FILENO, bytes.data(), bytes.size());
        if (written >= 0) {
            bytes.remove_prefix(static_cast<std::size_t>(written));
        } else if (errno == EAGAIN) { // a process that shares the pipe made it non-blocking
            pollfd ready{STDOUT_FILENO, POLLOUT, 0};
            ::poll(&ready, 1, -1);
        } else if (errno != EINTR) {
            error_ = errno;
        }
    }
}

bool Output::finish()
{
    flush();
    if (failed() && error_ != EPIPE)
        reportFailure("standard output", SystemErrorText(error_));
    return !failed();
}
