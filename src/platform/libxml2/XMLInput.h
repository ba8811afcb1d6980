// Feeds the bytes of a stream to libxml2: reads in pieces, decodes to UTF-8. libxml2's own decoders are not used,
// because they report bad bytes to the process-wide error handlers.
#pragma once

#include "platform/XMLParser.h"

#include <array>
#include <string>
#include <string_view>

namespace platform::libxml2 {

class XMLInput {
public:
    explicit XMLInput(InputStream& stream) : stream_(stream) {}
    void setProgressHandler(XMLParser::ProgressHandler handler) { progress_ = std::move(handler); }

    /// The next bytes in UTF-8, valid until the next call; empty at the end and after a failure.
    std::string_view next(std::size_t most);

    bool failed() const { return failed_; }
    const Error& error() const { return error_; }

private:
    enum class Encoding { unknown, utf8, latin1, utf16Big, utf16Little };

    void refill();
    std::string_view readPiece();
    bool chooseEncoding();
    bool chooseDeclaredEncoding();
    void decodeLatin1(std::string_view piece);
    void decodeUTF16(std::string_view piece);
    void appendUnit(char16_t unit);
    void append(char32_t character);
    void fail(const char* domain, std::int64_t code, std::string description);
    void failEncoding(std::string description);

    InputStream& stream_;
    XMLParser::ProgressHandler progress_;
    std::uint64_t bytesRead_ = 0;
    std::array<std::byte, 64 * 1024> piece_;
    std::string start_;        // the first bytes, until the encoding is known
    std::string decoded_;      // the decoded piece, unless it is taken as it is
    std::string_view waiting_; // UTF-8 that was not handed out yet
    Encoding encoding_ = Encoding::unknown;
    bool atStart_ = true; // nothing was handed out yet
    bool atEnd_ = false;
    bool failed_ = false;
    std::optional<char> oddByte_; // the first half of a UTF-16 unit
    char16_t highSurrogate_ = 0;
    Error error_;
};

} // namespace platform::libxml2
