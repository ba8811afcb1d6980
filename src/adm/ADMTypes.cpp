#include "adm/ADMTypes.h"

#include "adm/ADMAttributes.h"
#include "adm/ADMException.h"
#include "adm/ADMText.h"

#include <algorithm>
#include <charconv>
#include <span>

namespace {

constexpr std::uint32_t kUnknownName = 0xFFFF;
constexpr ADMType_t kFirstCustomType = 0x1000;
constexpr ADMType_t kLastCustomType = 0xFFFF;

// The value of a name is its row, counted from 1.
constexpr std::string_view kTypeNames[] = {"DirectSpeakers", "Matrix", "Objects", "HOA", "Binaural"};
static_assert(std::size(kTypeNames) == 5);
constexpr std::string_view kFormatNames[] = {"PCM"};

std::uint32_t fromLabel(std::optional<std::string_view> label)
{
    std::uint32_t value = 0;
    if (label)
        std::from_chars(label->data(), label->data() + label->size(), value, 16); // stays 0 if the text cannot be read
    return value;
}

std::uint32_t fromName(std::optional<std::string_view> name, std::span<const std::string_view> names)
{
    if (!name || name->empty())
        return 0;
    const auto found = std::find(names.begin(), names.end(), *name);
    return found == names.end() ? kUnknownName : static_cast<std::uint32_t>(found - names.begin()) + 1;
}

template <class Source>
ADMType_t requiredType(const Source& source, std::string_view nodeName)
{
    if (const ADMType_t type = ADMGetTypeFromTypeLabel(ADMGetAttribute(source, "typeLabel")); type != 0)
        return type;
    if (const ADMType_t type = ADMGetTypeFromName(ADMGetAttribute(source, "typeDefinition")); type != 0)
        return type;
    throw ADMException(kADMExceptionMalformedDefinition, "unsupported type for node " + std::string(nodeName));
}

template <class Source>
std::uint32_t requiredFormat(const Source& source, std::string_view nodeName)
{
    if (const auto format = ADMGetFormatFromFormatLabel(ADMGetAttribute(source, "formatLabel")); format != 0)
        return format;
    if (const auto format = ADMGetFormatFromName(ADMGetAttribute(source, "formatDefinition")); format != 0)
        return format;
    throw ADMException(kADMExceptionMalformedDefinition, "unsupported format for node " + std::string(nodeName));
}

} // namespace

ADMType_t ADMGetTypeFromTypeLabel(std::optional<std::string_view> label)
{
    return fromLabel(label);
}

ADMType_t ADMGetTypeFromName(std::optional<std::string_view> name)
{
    return fromName(name, kTypeNames);
}

std::string ADMGetNameForType(ADMType_t type)
{
    if (type >= kFirstCustomType && type <= kLastCustomType)
        return "Custom_" + adm::hexText(type);
    if (type >= 1 && type <= std::size(kTypeNames))
        return std::string(kTypeNames[type - 1]);
    return "Unknown";
}

ADMType_t ADMGetTypeFromRequiredTypeLabelOrName(const platform::XMLAttributes& attributes, std::string_view nodeName)
{
    return requiredType(attributes, nodeName);
}

ADMType_t ADMGetTypeFromRequiredTypeLabelOrName(const platform::XMLNode& node, std::string_view nodeName)
{
    return requiredType(node, nodeName);
}

std::uint32_t ADMGetFormatFromFormatLabel(std::optional<std::string_view> label)
{
    return fromLabel(label);
}

std::uint32_t ADMGetFormatFromName(std::optional<std::string_view> name)
{
    return fromName(name, kFormatNames);
}

std::uint32_t ADMGetFormatFromRequiredFormatLabelOrName(const platform::XMLAttributes& attributes,
                                                        std::string_view nodeName)
{
    return requiredFormat(attributes, nodeName);
}

std::uint32_t ADMGetFormatFromRequiredFormatLabelOrName(const platform::XMLNode& node, std::string_view nodeName)
{
    return requiredFormat(node, nodeName);
}

std::string ADMGetNameForFormat(std::uint32_t format)
{
    return format == kADMFormatPCM ? std::string(kFormatNames[0]) : "Unknown";
}
