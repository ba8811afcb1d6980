#include "tool/page/PageServer.h"

#include "platform/OwnedDescriptor.h"
#include "tool/page/PageDocument.h"
#include "tool/page/WaveStream.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <climits>
#include <fcntl.h>
#include <string_view>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr int kOK = 200, kForbidden = 403, kNotFound = 404, kWrongMethod = 405;
constexpr std::size_t kTokenBytes = 16;
constexpr std::int64_t kMostServed = 256 * 1024; // at once

std::string newToken()
{
    std::array<unsigned char, kTokenBytes> bytes = {};
    if (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size()))
        throw Failure("no random numbers are to be had: " + SystemErrorText(errno));
    std::string token;
    for (const unsigned char byte : bytes)
        token += fmt::format("{:02x}", byte);
    return token;
}

// In a time that does not tell how much is right.
bool isSameText(std::string_view one, std::string_view other)
{
    if (one.size() != other.size())
        return false;
    volatile unsigned char difference = 0;
    for (std::size_t i = 0; i < one.size(); ++i)
        difference = static_cast<unsigned char>(difference | (one[i] ^ other[i]));
    return difference == 0;
}

class PageBody : public ServedBody {
public:
    explicit PageBody(std::string text) : text_(std::move(text)) {}
    std::int64_t size() const override { return std::ssize(text_); }
    std::string type() const override { return "text/html; charset=utf-8"; }
    std::string read(std::int64_t offset, std::size_t wanted) override
    {
        return text_.substr(static_cast<std::size_t>(offset), wanted);
    }

private:
    const std::string text_;
};

class FileBody : public ServedBody {
public:
    FileBody(platform::OwnedDescriptor file, std::int64_t size, std::string type)
        : file_(std::move(file)),
          size_(size),
          type_(std::move(type))
    {
    }
    std::int64_t size() const override { return size_; }
    std::string type() const override { return type_; }
    std::string read(std::int64_t offset, std::size_t wanted) override
    {
        std::string bytes(std::min<std::size_t>(wanted, kMostServed), '\0');
        ssize_t count = 0;
        do
            count = ::pread(file_.get(), bytes.data(), bytes.size(), offset);
        while (count < 0 && errno == EINTR);
        bytes.resize(static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
        return bytes;
    }

private:
    platform::OwnedDescriptor file_;
    std::int64_t size_;
    std::string type_;
};

class DecodedBody : public ServedBody {
public:
    // The file stays open, since its name by the descriptor is what was opened for decoding.
    explicit DecodedBody(platform::OwnedDescriptor file)
        : file_(std::move(file)),
          stream_(platform::pathOfDescriptor(file_.get()), {})
    {
    }
    std::int64_t size() const override { return stream_.size(); }
    std::string type() const override { return "audio/wav"; }
    std::string read(std::int64_t offset, std::size_t wanted) override { return stream_.read(offset, wanted); }

private:
    platform::OwnedDescriptor file_;
    WaveStream stream_;
};

// The path of an open file, links resolved; empty if the system does not say it.
std::string pathOf(const platform::OwnedDescriptor& file)
{
    char path[PATH_MAX];
    const ssize_t length = ::readlink(fmt::format("/proc/self/fd/{}", file.get()).c_str(), path, sizeof path);
    return length > 0 && length < PATH_MAX ? std::string(path, static_cast<std::size_t>(length)) : std::string();
}

// The file of a row: regular, and where it really is its place in the index, or below a folder that was indexed.
// Invalid otherwise.
platform::OwnedDescriptor openedSound(const PageRow& row, const std::vector<std::string>& roots, struct stat& status)
{
    // A FIFO that took the file's name must not hold the server up.
    constexpr int flags = O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK;
    platform::OwnedDescriptor file(::open(row.place.path().c_str(), flags));
    if (!file || ::fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode))
        return {};
    const std::string path = pathOf(file);
    const bool isKnown = path == row.place.path() ||
                         std::ranges::any_of(roots, [&](const std::string& root) { return path.starts_with(root); });
    return isKnown ? std::move(file) : platform::OwnedDescriptor();
}

// The media type for the header, without what decides only whether a browser plays it.
std::string typeForHeader(const std::string& type)
{
    return type.empty() ? "application/octet-stream" : type.substr(0, type.find(';'));
}

} // namespace

PageSite::PageSite(std::vector<PageRow> rows, std::string page, std::vector<std::string> roots)
    : rows_(std::move(rows)),
      page_(std::make_shared<PageBody>(std::move(page))),
      roots_(std::move(roots)),
      token_(newToken()),
      policy_(PageDocument::policy() + "; frame-ancestors 'none'")
{
}

void PageSite::eachHeader(const std::function<void(const char*, const std::string&)>& visit) const
{
    visit("Cache-Control", "no-store");
    visit("X-Content-Type-Options", "nosniff");
    visit("Referrer-Policy", "no-referrer"); // the token is in the address
    visit("Cross-Origin-Resource-Policy", "same-origin");
    visit("Content-Security-Policy", policy_);
}

// A page of another site can have a name of its own lead to this machine, but its requests say that name.
bool PageSite::isOwnHost(const std::string& host) const
{
    return host == fmt::format("127.0.0.1:{}", port_) || host == fmt::format("localhost:{}", port_);
}

bool PageSite::hasToken(const std::string& path) const
{
    return path.size() > token_.size() + 1 && path.front() == '/' && path[token_.size() + 1] == '/' &&
           isSameText(std::string_view(path).substr(1, token_.size()), token_);
}

ServedAnswer PageSite::answer(const std::string& method, const std::string& path, const std::string& host)
{
    if (!isOwnHost(host) || !hasToken(path))
        return {kForbidden, nullptr};
    if (method != "GET" && method != "HEAD")
        return {kWrongMethod, nullptr};
    try {
        return answerFor(path.substr(token_.size() + 2));
    } catch (const std::exception&) { // the file is no sound any more, or memory is short
        return {kNotFound, nullptr};
    }
}

const PageRow* PageSite::rowOf(const std::string& number) const
{
    std::size_t row = 0;
    const char* const end = number.data() + number.size();
    const auto [stop, error] = std::from_chars(number.data(), end, row);
    return error == std::errc() && stop == end && row < rows_.size() ? &rows_[row] : nullptr;
}

ServedAnswer PageSite::answerFor(const std::string& item) const
{
    if (item.empty())
        return {kOK, page_};
    const std::size_t slash = item.find('/');
    const std::string what = item.substr(0, slash);
    const PageRow* const row = slash == item.npos ? nullptr : rowOf(item.substr(slash + 1));
    const bool isDecoded = what == "decoded";
    if (row == nullptr || (!isDecoded && what != "file"))
        return {kNotFound, nullptr};
    struct stat status = {};
    platform::OwnedDescriptor file = openedSound(*row, roots_, status);
    if (!file)
        return {kNotFound, nullptr};
    if (isDecoded)
        return {kOK, std::make_shared<DecodedBody>(std::move(file))};
    return {kOK, std::make_shared<FileBody>(std::move(file), status.st_size, typeForHeader(row->type))};
}
