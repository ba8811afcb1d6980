#include "platform/libxml2/XMLInput.h"

#include "platform/core/ASCIICase.h"
#include "platform/core/Status.h"

#include <libxml/xmlerror.h>

namespace platform::libxml2 {

namespace {

// An XML declaration is searched for in the first bytes only.
constexpr std::size_t kStart = 1024;

/// The value of "encoding" in the XML declaration that `text` begins with; empty if there is none.
std::string_view declaredEncoding(std::string_view text)
{
    if (!text.starts_with("<?xml") || text.find_first_of(" \t\r\n") != 5) // not "<?xml-stylesheet"
        return {};
    text = text.substr(0, text.find("?>"));
    std::size_t at = text.find("encoding");
    if (at == text.npos)
        return {};
    at = text.find_first_of("\"'", at);
    if (at == text.npos)
        return {};
    const std::size_t end = text.find(text[at], at + 1);
    return end == text.npos ? std::string_view() : text.substr(at + 1, end - at - 1);
}

bool isOneOf(std::string_view name, std::initializer_list<std::string_view> names)
{
    return std::any_of(names.begin(), names.end(),
                       [&](std::string_view known) { return equalIgnoringASCIICase(name, known); });
}

} // namespace

std::string_view XMLInput::next(std::size_t most)
{
    while (waiting_.empty() && !atEnd_ && !failed_)
        refill();
    const std::string_view text = waiting_.substr(0, most);
    waiting_.remove_prefix(text.size());
    return text;
}

/// Leaves text in `waiting_`; none if the piece held none, at the end, and after a failure.
void XMLInput::refill()
{
    std::string_view piece;
    if (encoding_ == Encoding::unknown) {
        while (start_.size() < kStart && !atEnd_ && !failed_)
            start_ += readPiece();
        if (!chooseEncoding()) // the text before a failure still counts
            return;
        piece = start_;
    } else {
        piece = readPiece();
    }
    if (encoding_ == Encoding::utf8) {
        waiting_ = piece;
    } else {
        decoded_.clear();
        if (encoding_ == Encoding::latin1)
            decodeLatin1(piece);
        else
            decodeUTF16(piece);
        waiting_ = decoded_;
    }
    // The parser would take a NUL for the end of the document.
    if (const std::size_t nul = waiting_.find('\0'); nul != waiting_.npos) {
        waiting_ = waiting_.substr(0, nul);
        failEncoding("a NUL character");
    }
    // From any other first character the parser would guess an encoding.
    if (atStart_ && !waiting_.empty()) {
        atStart_ = false;
        if (std::string_view("< \t\r\n").find(waiting_.front()) == std::string_view::npos) {
            waiting_ = {};
            failEncoding("the document does not begin with '<'");
        }
    }
}

std::string_view XMLInput::readPiece()
{
    const std::ptrdiff_t count = stream_.read(piece_);
    if (count <= 0) {
        atEnd_ = true;
        if (count < 0)
            fail(ErrorDomain::status, count,
                 std::string("cannot read: ") + StatusText(static_cast<std::int32_t>(count)));
        return {};
    }
    bytesRead_ += static_cast<std::uint64_t>(count);
    if (progress_ && !progress_(bytesRead_)) {
        fail(ErrorDomain::status, kStatusUserCancelled, StatusText(kStatusUserCancelled));
        return {};
    }
    return textOf(std::span(piece_).first(static_cast<std::size_t>(count)));
}

bool XMLInput::chooseEncoding()
{
    struct Mark {
        std::string_view bytes;
        Encoding encoding;
        std::size_t skip;
    };
    using namespace std::string_view_literals;
    static constexpr Mark marks[] = {
        {"\xEF\xBB\xBF"sv, Encoding::utf8, 3},    {"\xFE\xFF"sv, Encoding::utf16Big, 2},
        {"\xFF\xFE"sv, Encoding::utf16Little, 2}, {"\0<"sv, Encoding::utf16Big, 0},
        {"<\0"sv, Encoding::utf16Little, 0},
    };
    for (const Mark& mark : marks) {
        if (start_.starts_with(mark.bytes)) {
            encoding_ = mark.encoding;
            start_.erase(0, mark.skip);
            return true;
        }
    }
    return chooseDeclaredEncoding();
}

bool XMLInput::chooseDeclaredEncoding()
{
    const std::string_view name = declaredEncoding(start_);
    if (name.empty() || isOneOf(name, {"UTF-8", "UTF8", "US-ASCII", "ASCII"})) {
        encoding_ = Encoding::utf8;
    } else if (isOneOf(name, {"ISO-8859-1", "ISO_8859-1", "Latin1"})) {
        encoding_ = Encoding::latin1;
    } else {
        failEncoding("the encoding '" + std::string(name.substr(0, 40)) + "' is not supported");
        return false;
    }
    return true;
}

void XMLInput::decodeLatin1(std::string_view piece)
{
    for (const char c : piece)
        append(static_cast<unsigned char>(c));
}

void XMLInput::decodeUTF16(std::string_view piece)
{
    const auto unit = [this](char first, char second) {
        const auto high = static_cast<unsigned char>(encoding_ == Encoding::utf16Big ? first : second);
        const auto low = static_cast<unsigned char>(encoding_ == Encoding::utf16Big ? second : first);
        return static_cast<char16_t>(high << 8 | low);
    };
    for (const char c : piece) {
        if (oddByte_) {
            appendUnit(unit(*oddByte_, c));
            oddByte_.reset();
        } else {
            oddByte_ = c;
        }
        if (failed_)
            return;
    }
    if (atEnd_ && (oddByte_ || highSurrogate_ != 0))
        failEncoding("the document ends within a character");
}

void XMLInput::appendUnit(char16_t unit)
{
    const bool isHigh = unit >= 0xD800 && unit < 0xDC00;
    const bool isLow = unit >= 0xDC00 && unit < 0xE000;
    if (isLow != (highSurrogate_ != 0)) {
        failEncoding("a surrogate stands alone");
        return;
    }
    if (isLow)
        append(0x10000U + ((highSurrogate_ - 0xD800U) << 10) + (unit - 0xDC00U));
    else if (!isHigh)
        append(unit);
    highSurrogate_ = isHigh ? unit : char16_t{0};
}

void XMLInput::append(char32_t character)
{
    const auto put = [this](char32_t bits) { decoded_ += static_cast<char>(bits); };
    if (character < 0x80) {
        put(character);
    } else if (character < 0x800) {
        put(0xC0 | character >> 6);
        put(0x80 | (character & 0x3F));
    } else {
        if (character < 0x10000) {
            put(0xE0 | character >> 12);
        } else {
            put(0xF0 | character >> 18);
            put(0x80 | (character >> 12 & 0x3F));
        }
        put(0x80 | (character >> 6 & 0x3F));
        put(0x80 | (character & 0x3F));
    }
}

void XMLInput::fail(const char* domain, std::int64_t code, std::string description)
{
    if (failed_)
        return;
    failed_ = true;
    platform::fail(&error_, domain, code, std::move(description));
}

void XMLInput::failEncoding(std::string description)
{
    fail(kXMLErrorDomain, XML_ERR_INVALID_ENCODING, std::move(description));
}

} // namespace platform::libxml2
