// The identifiers of ITU-R BS.2076: a prefix, which names the kind of element, and hexadecimal fields.
#pragma once

#include "adm/ADMTypes.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <string>
#include <string_view>

inline constexpr const char* kADMAudioProgrammePrefix = "APR";    // of audioProgramme
inline constexpr const char* kADMAudioContentPrefix = "ACO";      // of audioContent
inline constexpr const char* kADMAudioObjectPrefix = "AO";        // of audioObject
inline constexpr const char* kADMAudioPackFormatPrefix = "AP";    // of audioPackFormat
inline constexpr const char* kADMAudioChannelFormatPrefix = "AC"; // of audioChannelFormat
inline constexpr const char* kADMAudioStreamFormatPrefix = "AS";  // of audioStreamFormat
inline constexpr const char* kADMAudioTrackFormatPrefix = "AT";   // of audioTrackFormat
inline constexpr const char* kADMAudioTrackUIDPrefix = "ATU";     // of audioTrackUID
inline constexpr const char* kADMAudioBlockPrefix = "AB";         // of audioBlockFormat

/// Splits an ID. Any pointer may be null; a value for which the prefix has no field is left as it is.
///
/// | prefix | form | fields |
/// |---|---|---|
/// | AP, AC, AS | AP_yyyyxxxx | type, index |
/// | AT | AT_yyyyxxxx_zz | type, index, subIndex |
/// | AB | AB_yyyyxxxx_zzzzzzzz | type, index, subIndex |
/// | ATU | ATU_xxxxxxxx | index |
/// | APR, ACO, AO | AO_xxxx | index |
/// | AVS | AVS_xxxx_zzzz | index, subIndex |
///
/// The prefix is given in upper case. A field is read, and so checked, when it is asked for; the eight digits of AP,
/// AC, AS, AT and AB always. Text after the last field is ignored. Raises MalformedIDString.
KT_EXPORT void ADMParseIdentifier(std::string_view identifier, std::string* prefix, ADMType_t* type,
                                  std::uint32_t* index, std::uint32_t* subIndex);

/// Raises WrongIDPrefix when `prefix` is not `expected`; `element` is the element's name.
KT_EXPORT void ADMRequirePrefix(std::string_view prefix, std::string_view expected, std::string_view element);

namespace adm {

inline constexpr std::size_t kLongestPrefix = 3; // of the prefixes above, in characters
inline constexpr std::uint32_t kNoPrefix = 1;    // packed; each character is put behind what is there

/// The characters of a prefix in one number, which compares fast; 0 for a text longer than kLongestPrefix.
constexpr std::uint32_t packedPrefix(std::string_view prefix)
{
    if (prefix.size() > kLongestPrefix)
        return 0;
    std::uint32_t packed = kNoPrefix;
    for (const char c : prefix)
        packed = packed << 8 | static_cast<unsigned char>(c);
    return packed;
}

/// ADMParseIdentifier, but returns the prefix, which lives for ever.
std::string_view parseIdentifier(std::string_view identifier, ADMType_t* type, std::uint32_t* index,
                                 std::uint32_t* subIndex);

} // namespace adm
