#include "tool/index/InputLines.h"

#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <fcntl.h>
#include <unistd.h>

namespace {

constexpr std::size_t kLongestInputLine = 64 << 20;
constexpr std::size_t kPieceOfInput = 1 << 18;

} // namespace

InputLines::InputLines(const std::string& name)
    : opened_(name == kStandardInput ? -1 : ::open(name.c_str(), O_RDONLY | O_NOCTTY | O_CLOEXEC)),
      descriptor_(name == kStandardInput ? STDIN_FILENO : opened_.get())
{
    if (descriptor_ < 0)
        throw Failure(SystemErrorText(errno));
}

bool InputLines::readMore()
{
    buffer_.erase(0, start_);
    start_ = 0;
    const std::size_t kept = buffer_.size();
    if (kept > kLongestInputLine)
        throw Failure("a line has more than 64 MiB");
    buffer_.resize(kept + kPieceOfInput);
    ssize_t got = 0;
    do
        got = ::read(descriptor_, buffer_.data() + kept, kPieceOfInput);
    while (got < 0 && errno == EINTR);
    const int error = errno;
    buffer_.resize(kept + static_cast<std::size_t>(got < 0 ? 0 : got));
    if (got < 0)
        throw Failure(error == EISDIR ? "is a folder" : SystemErrorText(error));
    return got > 0;
}

bool InputLines::beginsWith(std::string_view bytes)
{
    while (buffer_.size() < bytes.size())
        if (!readMore())
            return false;
    return std::string_view(buffer_).starts_with(bytes);
}

bool InputLines::next(std::string_view& line)
{
    std::size_t looked = start_;
    for (;;) {
        if (const std::size_t end = buffer_.find('\n', looked); end != buffer_.npos) {
            line = std::string_view(buffer_).substr(start_, end - start_);
            start_ = end + 1;
            ++number_;
            return true;
        }
        looked = buffer_.size() - start_; // where it is once the rest was moved to the front
        if (!readMore())
            break;
    }
    if (buffer_.empty())
        return false;
    line = buffer_;
    start_ = buffer_.size();
    ++number_;
    return true;
}
