#include "platform/PropertyList.h"
#include "platform/String.h"
#include "platform/plist/PropertyListXML.h"

#include <array>
#include <charconv>
#include <chrono>
#include <cstdio>

namespace platform::plist {

namespace {

/// Writes the text line by line, a tab per level.
class XMLWriter {
public:
    explicit XMLWriter(std::string& problem) : problem_(problem) {}
    bool write(const Value& value, Bytes& bytes);

private:
    bool writeValue(const Value& value, std::size_t depth);
    bool writeArray(const Array& array, std::size_t depth);
    bool writeDictionary(const Dictionary& dictionary, std::size_t depth);
    bool writeText(std::size_t depth, std::string_view element, const std::string& text);
    bool writeDate(std::size_t depth, Date date);
    void writeReal(std::size_t depth, double real);
    void writeData(std::size_t depth, const Bytes& data);
    bool writeEscaped(const std::string& text);

    void indent(std::size_t depth) { out_.append(depth, '\t'); }
    void line(std::size_t depth, std::string_view text)
    {
        indent(depth);
        (out_ += text) += '\n';
    }
    void leaf(std::size_t depth, const std::string& element, std::string_view content)
    {
        indent(depth);
        (out_ += "<" + element + ">") += content;
        out_ += "</" + element + ">\n";
    }
    bool fail(const char* problem)
    {
        problem_ = problem;
        return false;
    }

    std::string out_;
    std::string& problem_;
};

bool XMLWriter::write(const Value& value, Bytes& bytes)
{
    line(0, "<?xml version=\"1.0\" encoding=\"UTF-8\"?>");
    line(0, "<plist version=\"1.0\">");
    if (!writeValue(value, 0))
        return false;
    line(0, "</plist>");
    const BytesView text = bytesOf(out_);
    bytes.assign(text.begin(), text.end());
    return true;
}

bool XMLWriter::writeValue(const Value& value, std::size_t depth)
{
    if (const auto* text = value.get<std::string>())
        return writeText(depth, "string", *text);
    if (const auto* date = value.get<Date>())
        return writeDate(depth, *date);
    if (const auto* array = value.get<Array>())
        return writeArray(*array, depth);
    if (const auto* dictionary = value.get<Dictionary>())
        return writeDictionary(*dictionary, depth);
    if (const auto* flag = value.get<bool>())
        line(depth, *flag ? "<true/>" : "<false/>");
    else if (const auto* integer = value.get<std::int64_t>())
        leaf(depth, "integer", std::to_string(*integer));
    else if (const auto* real = value.get<double>())
        writeReal(depth, *real);
    else if (const auto* data = value.get<Bytes>())
        writeData(depth, *data);
    else
        return fail("a property list cannot hold null");
    return true;
}

bool XMLWriter::writeArray(const Array& array, std::size_t depth)
{
    if (depth == std::size_t{kPropertyListMaximumDepth})
        return fail("it is nested too deeply");
    if (array.empty()) {
        line(depth, "<array/>");
        return true;
    }
    line(depth, "<array>");
    for (const Value& element : array)
        if (!writeValue(element, depth + 1))
            return false;
    line(depth, "</array>");
    return true;
}

bool XMLWriter::writeDictionary(const Dictionary& dictionary, std::size_t depth)
{
    if (depth == std::size_t{kPropertyListMaximumDepth})
        return fail("it is nested too deeply");
    if (dictionary.empty()) {
        line(depth, "<dict/>");
        return true;
    }
    line(depth, "<dict>");
    for (const auto& [key, content] : dictionary)
        if (!writeText(depth + 1, "key", key) || !writeValue(content, depth + 1))
            return false;
    line(depth, "</dict>");
    return true;
}

bool XMLWriter::writeText(std::size_t depth, std::string_view element, const std::string& text)
{
    indent(depth);
    ((out_ += '<') += element) += '>';
    if (!writeEscaped(text))
        return false;
    ((out_ += "</") += element) += ">\n";
    return true;
}

bool XMLWriter::writeEscaped(const std::string& text)
{
    if (String::fromUTF8(text).isNull())
        return fail("a text is not UTF-8");
    if (text.find("\xEF\xBF\xBE") != text.npos || text.find("\xEF\xBF\xBF") != text.npos)
        return fail("XML has no form for U+FFFE and U+FFFF");
    for (const char c : text) {
        if (c == '&')
            out_ += "&amp;";
        else if (c == '<')
            out_ += "&lt;";
        else if (c == '>')
            out_ += "&gt;";
        else if (c == '\r')
            out_ += "&#13;"; // readers take a bare carriage return for a line feed
        else if (static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n')
            return fail("XML has no form for control characters");
        else
            out_ += c;
    }
    return true;
}

bool XMLWriter::writeDate(std::size_t depth, Date date)
{
    using namespace std::chrono;
    constexpr sys_seconds epoch = sys_days(year(2001) / January / 1);
    constexpr sys_seconds first = sys_days(year(1) / January / 1);
    constexpr sys_seconds end = sys_days(year(10000) / January / 1);
    const double t = date.secondsSince2001;
    // Written so that a NaN is refused too.
    if (!(t >= static_cast<double>((first - epoch).count()) && t < static_cast<double>((end - epoch).count())))
        return fail("XML has no form for dates outside of the years 1 to 9999");
    const sys_seconds time = epoch + floor<seconds>(duration<double>(t));
    const auto midnight = floor<days>(time);
    const year_month_day day(midnight);
    const hh_mm_ss clock(time - midnight);
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%04d-%02u-%02uT%02d:%02d:%02dZ", int{day.year()}, unsigned{day.month()},
                  unsigned{day.day()}, static_cast<int>(clock.hours().count()),
                  static_cast<int>(clock.minutes().count()), static_cast<int>(clock.seconds().count()));
    leaf(depth, "date", text.data());
    return true;
}

void XMLWriter::writeReal(std::size_t depth, double real)
{
    // The shortest text that reads back as the same number in any locale; readers understand "inf" and "nan".
    std::array<char, 64> text{};
    const auto result = std::to_chars(text.data(), text.data() + text.size(), real);
    leaf(depth, "real", {text.data(), static_cast<std::size_t>(result.ptr - text.data())});
}

void XMLWriter::writeData(std::size_t depth, const Bytes& data)
{
    constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    constexpr std::size_t bytesPerLine = 57; // 76 characters
    line(depth, "<data>");
    for (std::size_t start = 0; start < data.size(); start += bytesPerLine) {
        const std::size_t end = std::min(start + bytesPerLine, data.size());
        indent(depth);
        for (std::size_t i = start; i < end; i += 3) {
            unsigned bits = 0;
            for (std::size_t k = 0; k < 3; ++k)
                bits = bits << 8 | (i + k < end ? std::to_integer<unsigned>(data[i + k]) : 0U);
            out_ += digits[bits >> 18];
            out_ += digits[bits >> 12 & 63];
            out_ += i + 1 < end ? digits[bits >> 6 & 63] : '=';
            out_ += i + 2 < end ? digits[bits & 63] : '=';
        }
        out_ += '\n';
    }
    line(depth, "</data>");
}

} // namespace

bool writeXML(const Value& value, Bytes& bytes, std::string& problem)
{
    return XMLWriter(problem).write(value, bytes);
}

} // namespace platform::plist
