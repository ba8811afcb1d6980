#include "adm/ADMIdentifier.h"

#include "adm/ADMException.h"

#include <algorithm>
#include <array>

namespace {

struct Form {
    std::string_view prefix;
    std::size_t digits;    // of the first field
    std::size_t subDigits; // of the second; 0 if there is none
    bool hasType;          // the first field is a type and an index, of four digits each
};

constexpr Form kForms[] = {
    {kADMAudioBlockPrefix, 8, 8, true},         {kADMAudioTrackUIDPrefix, 8, 0, false},
    {kADMAudioObjectPrefix, 4, 0, false},       {kADMAudioTrackFormatPrefix, 8, 2, true},
    {kADMAudioChannelFormatPrefix, 8, 0, true}, {kADMAudioPackFormatPrefix, 8, 0, true},
    {kADMAudioStreamFormatPrefix, 8, 0, true},  {kADMAudioContentPrefix, 4, 0, false},
    {kADMAudioProgrammePrefix, 4, 0, false},    {"AVS", 4, 4, false},
};
static_assert(std::size(kForms) == 10);

constexpr std::array<std::uint8_t, 256> kDigits = [] {
    std::array<std::uint8_t, 256> values{};
    values.fill(0xFF);
    for (unsigned i = 0; i < 16; ++i) {
        values[static_cast<unsigned char>("0123456789abcdef"[i])] = static_cast<std::uint8_t>(i);
        values[static_cast<unsigned char>("0123456789ABCDEF"[i])] = static_cast<std::uint8_t>(i);
    }
    return values;
}();

[[noreturn]] void raiseUnsupported(std::string_view identifier)
{
    throw ADMException(kADMExceptionMalformedIDString, "unsupported prefix in ID " + std::string(identifier));
}

/// Reads the number at `at`, which has exactly that many digits, and moves `at` past it.
std::uint32_t readField(std::string_view identifier, std::size_t& at, std::size_t digits)
{
    const std::size_t begin = at;
    std::uint32_t value = 0;
    for (; at < identifier.size(); ++at) {
        const std::uint8_t digit = kDigits[static_cast<unsigned char>(identifier[at])];
        if (digit == 0xFF)
            break;
        value = value << 4 | digit;
    }
    // Kept: the two texts differ in one blank.
    if (at == begin)
        throw ADMException(kADMExceptionMalformedIDString, "malformed identifier  " + std::string(identifier));
    if (at - begin != digits)
        throw ADMException(kADMExceptionMalformedIDString, "malformed identifier " + std::string(identifier));
    return value;
}

constexpr char upper(char c)
{
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

/// The form that belongs to the ID's prefix; moves `at` past the "_".
const Form& formOf(std::string_view identifier, std::size_t& at)
{
    std::uint32_t prefix = adm::kNoPrefix;
    for (; at < std::min(identifier.size(), adm::kLongestPrefix + 1); ++at) {
        if (identifier[at] == '_') {
            ++at;
            for (const Form& form : kForms)
                if (adm::packedPrefix(form.prefix) == prefix)
                    return form;
            break;
        }
        prefix = prefix << 8 | static_cast<unsigned char>(upper(identifier[at]));
    }
    raiseUnsupported(identifier);
}

} // namespace

std::string_view adm::parseIdentifier(std::string_view identifier, ADMType_t* type, std::uint32_t* index,
                                      std::uint32_t* subIndex)
{
    std::size_t at = 0;
    const Form& form = formOf(identifier, at);
    if (form.hasType || index != nullptr) {
        const std::uint32_t field = readField(identifier, at, form.digits);
        if (form.hasType && type != nullptr)
            *type = field >> 16;
        if (index != nullptr)
            *index = form.hasType ? field & 0xFFFF : field;
    } else if (form.subDigits != 0) {
        at = std::min(identifier.find('_', at), identifier.size()); // skips a field that nobody asked for
    }
    if (form.subDigits != 0) {
        if (at == identifier.size() || identifier[at] != '_')
            raiseUnsupported(identifier);
        if (subIndex != nullptr)
            *subIndex = readField(identifier, ++at, form.subDigits);
    }
    return form.prefix;
}

void ADMParseIdentifier(std::string_view identifier, std::string* prefix, ADMType_t* type, std::uint32_t* index,
                        std::uint32_t* subIndex)
{
    const std::string_view found = adm::parseIdentifier(identifier, type, index, subIndex);
    if (prefix != nullptr)
        *prefix = found;
}

void ADMRequirePrefix(std::string_view prefix, std::string_view expected, std::string_view element)
{
    if (prefix == expected)
        return;
    throw ADMException(kADMExceptionWrongIDPrefix,
                       "prefix '" + std::string(prefix) + "' is not a valid prefix for " + std::string(element));
}
