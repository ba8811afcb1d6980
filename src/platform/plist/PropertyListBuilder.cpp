#include "platform/plist/PropertyListBuilder.h"

#include "platform/PropertyList.h"

#include <algorithm>
#include <charconv>
#include <chrono>
#include <limits>
#include <system_error>

namespace platform::plist {

namespace {

constexpr std::string_view kWhitespace = " \t\r\n";

std::string_view trimmed(std::string_view text)
{
    const auto first = text.find_first_not_of(kWhitespace);
    if (first == text.npos)
        return {};
    return text.substr(first, text.find_last_not_of(kWhitespace) - first + 1);
}

/// Parses decimal digits, or hexadecimal ones after "0x", with an optional sign.
bool parseInteger(std::string_view text, std::int64_t& result)
{
    const bool isNegative = text.starts_with('-');
    if (isNegative || text.starts_with('+'))
        text.remove_prefix(1);
    const bool isHexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (isHexadecimal)
        text.remove_prefix(2);
    std::uint64_t magnitude = 0;
    const auto [end, error] =
        std::from_chars(text.data(), text.data() + text.size(), magnitude, isHexadecimal ? 16 : 10);
    if (error != std::errc() || end != text.data() + text.size())
        return false;
    constexpr std::uint64_t limit = std::numeric_limits<std::int64_t>::max();
    if (magnitude > limit + (isNegative ? 1 : 0))
        return false;
    result = static_cast<std::int64_t>(isNegative ? 0 - magnitude : magnitude);
    return true;
}

bool parseReal(std::string_view text, double& result)
{
    if (text.starts_with('+')) {
        text.remove_prefix(1);
        if (text.starts_with('-'))
            return false;
    }
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), result);
    return error == std::errc() && end == text.data() + text.size();
}

/// Parses the digits of a fraction of a second: "25" is a quarter. False for anything else.
bool parseFraction(std::string_view digits, double& fraction)
{
    double scale = 1;
    for (const char c : digits) {
        if (c < '0' || c > '9')
            return false;
        fraction += (c - '0') * (scale /= 10);
    }
    return !digits.empty();
}

/// Parses the ISO 8601 form of property lists, "2026-11-21T12:30:00Z", and the fraction of a second that some writers
/// put before the "Z".
bool parseDate(std::string_view text, Date& result)
{
    constexpr std::string_view pattern = "dddd-dd-ddTdd:dd:dd";
    if (!text.ends_with('Z'))
        return false;
    text.remove_suffix(1);
    double fraction = 0;
    if (text.size() > pattern.size()) {
        if (text[pattern.size()] != '.' || !parseFraction(text.substr(pattern.size() + 1), fraction))
            return false;
        text = text.substr(0, pattern.size());
    }
    const auto matches = [](char c, char p) { return p == 'd' ? c >= '0' && c <= '9' : c == p; };
    if (!std::equal(text.begin(), text.end(), pattern.begin(), pattern.end(), matches))
        return false;
    const auto number = [&](std::size_t at, std::size_t count) {
        int digits = 0;
        std::from_chars(text.data() + at, text.data() + at + count, digits);
        return digits;
    };
    using namespace std::chrono;
    const year_month_day day{year(number(0, 4)), month(static_cast<unsigned>(number(5, 2))),
                             std::chrono::day(static_cast<unsigned>(number(8, 2)))};
    const int h = number(11, 2);
    const int m = number(14, 2);
    const int s = number(17, 2);
    if (!day.ok() || day.year() < year(1) || h > 23 || m > 59 || s > 59)
        return false;
    const auto days = sys_days(day) - sys_days(year(2001) / January / 1);
    result.secondsSince2001 = static_cast<double>(seconds(days).count() + h * 3600 + m * 60 + s) + fraction;
    return true;
}

int base64Digit(char c)
{
    if (c >= 'A' && c <= 'Z')
        return c - 'A';
    if (c >= 'a' && c <= 'z')
        return c - 'a' + 26;
    if (c >= '0' && c <= '9')
        return c - '0' + 52;
    return c == '+' ? 62 : c == '/' ? 63 : -1;
}

/// Decodes RFC 4648 with white space anywhere; padding may be missing.
bool parseBase64(std::string_view text, Bytes& result)
{
    result.reserve(text.size() / 4 * 3);
    std::uint32_t bits = 0;
    int digits = 0;
    int padding = 0;
    for (const char c : text) {
        if (kWhitespace.find(c) != kWhitespace.npos)
            continue;
        if (c == '=' && digits + padding < 4 && digits >= 2) {
            ++padding;
            continue;
        }
        const int digit = base64Digit(c);
        if (digit < 0 || padding > 0)
            return false;
        bits = bits << 6 | static_cast<std::uint32_t>(digit);
        if (++digits < 4)
            continue;
        for (int shift = 16; shift >= 0; shift -= 8)
            result.push_back(static_cast<std::byte>(bits >> shift));
        digits = 0;
    }
    if (digits == 1)
        return false;
    if (digits >= 2)
        result.push_back(static_cast<std::byte>(bits >> (digits * 6 - 8)));
    if (digits == 3)
        result.push_back(static_cast<std::byte>(bits >> 2));
    return true;
}

} // namespace

bool Builder::fail(std::string_view problem)
{
    if (problem_.empty())
        problem_ = problem;
    return false;
}

Builder::Element Builder::elementNamed(std::string_view name)
{
    struct Named {
        std::string_view name;
        Element element;
    };
    constexpr Named elements[] = {
        {"plist", Element::plist},   {"array", Element::array}, {"dict", Element::dict},       {"key", Element::key},
        {"string", Element::string}, {"data", Element::data},   {"date", Element::date},       {"true", Element::yes},
        {"false", Element::no},      {"real", Element::real},   {"integer", Element::integer},
    };
    const auto* found = std::find_if(std::begin(elements), std::end(elements),
                                     [&](const Named& element) { return element.name == name; });
    return found == std::end(elements) ? Element::none : found->element;
}

bool Builder::mayStart(Element element, std::string_view name)
{
    const std::string quoted = "\"" + std::string(name.substr(0, 40)) + "\"";
    if (element == Element::none)
        return fail("unknown element " + quoted);
    if (leaf_ != Element::none || isOpen_ == (element == Element::plist))
        return fail(isOpen_ ? "element " + quoted + " out of place" : "the outermost element is not \"plist\"");
    if (element == Element::plist)
        return true;
    if (containers_.empty()) {
        if (hasResult_)
            return fail("more than one value");
        return element != Element::key || fail("a key outside of a dictionary");
    }
    const Container& container = containers_.back();
    if (container.element == Element::array)
        return element != Element::key || fail("a key outside of a dictionary");
    if (container.hasKey == (element == Element::key))
        return fail(container.hasKey ? "a key without a value" : "a value without a key");
    return true;
}

bool Builder::startElement(std::string_view name)
{
    const Element element = elementNamed(name);
    if (!mayStart(element, name))
        return false;
    if (element == Element::plist) {
        isOpen_ = true;
    } else if (element == Element::array || element == Element::dict) {
        if (containers_.size() == std::size_t{kPropertyListMaximumDepth})
            return fail("it is nested too deeply");
        containers_.emplace_back().element = element;
    } else {
        leaf_ = element;
        text_.clear();
    }
    return true;
}

bool Builder::characters(std::string_view text)
{
    if (leaf_ != Element::none) {
        text_ += text;
        return true;
    }
    return trimmed(text).empty() || fail("text outside of an element that holds text");
}

bool Builder::endElement()
{
    if (leaf_ != Element::none)
        return endLeaf();
    if (!containers_.empty())
        return endContainer();
    return hasResult_ || fail("no value");
}

bool Builder::endContainer()
{
    Container ended = std::move(containers_.back());
    containers_.pop_back();
    if (ended.hasKey)
        return fail("a key without a value");
    if (ended.element == Element::array)
        add(std::move(ended.array));
    else
        add(std::move(ended.dictionary));
    return true;
}

bool Builder::endLeaf()
{
    if (leaf_ == Element::key) {
        containers_.back().key = std::move(text_);
        containers_.back().hasKey = true;
    } else {
        Value value;
        if (!leafValue(value)) {
            if (!isLenient_)
                return false;
            problem_.clear();
        }
        add(std::move(value));
    }
    leaf_ = Element::none;
    return true;
}

bool Builder::leafValue(Value& value)
{
    const std::string_view text = trimmed(text_);
    switch (leaf_) {
    case Element::string:
        value = std::move(text_);
        return true;
    case Element::yes:
    case Element::no:
        value = leaf_ == Element::yes;
        return text.empty() || fail("text in an empty element");
    case Element::integer: {
        std::int64_t integer = 0;
        const bool ok = parseInteger(text, integer);
        double real = 0;
        const bool isLong = !ok && isLenient_ && text.find_first_not_of("+-0123456789") == text.npos;
        if (ok)
            value = integer;
        else if (isLong && parseReal(text, real))
            value = real;
        return !value.isNull() || fail("not an integer of 64 bits");
    }
    case Element::real: {
        double real = 0;
        if (!parseReal(text, real))
            return fail("not a real number");
        value = real;
        return true;
    }
    case Element::date: {
        Date date;
        if (!parseDate(text, date))
            return fail("not a date");
        value = date;
        return true;
    }
    default: {
        Bytes data;
        if (!parseBase64(text, data))
            return fail("data is not base 64");
        value = std::move(data);
        return true;
    }
    }
}

void Builder::add(Value value)
{
    if (containers_.empty()) {
        result_ = std::move(value);
        hasResult_ = true;
        return;
    }
    Container& container = containers_.back();
    if (container.element == Element::array) {
        container.array.push_back(std::move(value));
        return;
    }
    container.hasKey = false;
    if (!value.isNull()) // null if it could not be read
        container.dictionary.insert_or_assign(container.dictionary.end(), std::move(container.key), std::move(value));
}

} // namespace platform::plist
