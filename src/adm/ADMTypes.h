// The two label tables of ITU-R BS.2076: what an element describes (typeLabel, typeDefinition), and how its samples
// are coded (formatLabel, formatDefinition).
#pragma once

#include "platform/XMLNode.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

/// 0: none. 1 to 5: DirectSpeakers, Matrix, Objects, HOA, Binaural. 0x1000 to 0xFFFF: custom.
using ADMType_t = std::uint32_t;

inline constexpr ADMType_t kADMTypeDirectSpeakers = 1; // channels that feed loudspeakers
inline constexpr ADMType_t kADMTypeObjects = 3;        // channels that sound from a place
inline constexpr std::uint32_t kADMFormatPCM = 1;      // linear PCM, the only row of the table of formats

/// The number of a hexadecimal label: "000A" is 10. 0 for no label and for one that cannot be read; the range is not
/// checked.
KT_EXPORT ADMType_t ADMGetTypeFromTypeLabel(std::optional<std::string_view> label);
/// The number of a name: 0 for no name or an empty one, 0xFFFF for a name that is not in the table.
KT_EXPORT ADMType_t ADMGetTypeFromName(std::optional<std::string_view> name);
/// The name in the table; "Custom_" and four digits for custom types, "Unknown" for other numbers.
KT_EXPORT std::string ADMGetNameForType(ADMType_t type);
/// The type by the attribute "typeLabel", else by "typeDefinition". Raises MalformedDefinition, naming `nodeName`,
/// when neither gives one.
KT_EXPORT ADMType_t ADMGetTypeFromRequiredTypeLabelOrName(const platform::XMLAttributes& attributes,
                                                          std::string_view nodeName);
/// The same of a tree's node.
KT_EXPORT ADMType_t ADMGetTypeFromRequiredTypeLabelOrName(const platform::XMLNode& node, std::string_view nodeName);

/// As ADMGetTypeFromTypeLabel, for formats.
KT_EXPORT std::uint32_t ADMGetFormatFromFormatLabel(std::optional<std::string_view> label);
/// As ADMGetTypeFromName, for formats, whose table has one row: 1 is "PCM".
KT_EXPORT std::uint32_t ADMGetFormatFromName(std::optional<std::string_view> name);
/// "PCM", or "Unknown" for other numbers.
KT_EXPORT std::string ADMGetNameForFormat(std::uint32_t format);
/// As ADMGetTypeFromRequiredTypeLabelOrName, by "formatLabel" and "formatDefinition".
KT_EXPORT std::uint32_t ADMGetFormatFromRequiredFormatLabelOrName(const platform::XMLAttributes& attributes,
                                                                  std::string_view nodeName);
/// The same of a tree's node.
KT_EXPORT std::uint32_t ADMGetFormatFromRequiredFormatLabelOrName(const platform::XMLNode& node,
                                                                  std::string_view nodeName);
