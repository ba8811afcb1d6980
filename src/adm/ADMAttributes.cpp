#include "adm/ADMAttributes.h"

#include "adm/ADMException.h"

using platform::XMLAttributes;
using platform::XMLNode;

namespace {

[[noreturn]] void raiseMalformed(std::string_view before, std::string_view name, std::string_view behind)
{
    std::string reason(before);
    ((reason += '\'') += name) += '\'';
    throw ADMException(kADMExceptionMalformedDefinition, reason += behind);
}

std::optional<std::string> textOf(std::optional<std::string_view> text)
{
    return text ? std::optional<std::string>(*text) : std::nullopt;
}

} // namespace

std::optional<std::string_view> ADMGetAttribute(const XMLAttributes& attributes, std::string_view name,
                                                std::optional<std::string_view> defaultValue)
{
    const std::optional<std::string_view> value = attributes.find(name);
    return value && !value->empty() ? value : defaultValue;
}

std::optional<std::string> ADMGetAttribute(const XMLNode& node, std::string_view name,
                                           std::optional<std::string_view> defaultValue)
{
    std::optional<std::string> value = node.attribute(name);
    return value && !value->empty() ? value : textOf(defaultValue);
}

std::string_view ADMGetRequiredAttribute(const XMLAttributes& attributes, std::string_view name)
{
    if (const auto value = ADMGetAttribute(attributes, name))
        return *value;
    raiseMalformed("Required attribute ", name, " not found");
}

std::string ADMGetRequiredAttribute(const XMLNode& node, std::string_view name)
{
    if (auto value = ADMGetAttribute(node, name))
        return *std::move(value);
    raiseMalformed("Required attribute ", name, " not found");
}

std::optional<std::string> ADMGetSubElementValue(const XMLNode& node, std::string_view name, std::size_t* count)
{
    const std::vector<XMLNode> found = node.elementsForName(name);
    if (count != nullptr)
        *count = found.size();
    return found.empty() ? std::nullopt : std::optional(found.front().stringValue());
}

std::optional<std::string> ADMGetUniqueSubElementValue(const XMLNode& node, std::string_view name,
                                                       std::optional<std::string_view> defaultValue)
{
    std::size_t count = 0;
    std::optional<std::string> value = ADMGetSubElementValue(node, name, &count);
    if (count > 1)
        raiseMalformed("Subelement ", name, " defined multiple times, but must be unique");
    return value ? value : textOf(defaultValue);
}

std::string ADMGetRequiredUniqueSubElementValue(const XMLNode& node, std::string_view name)
{
    std::size_t count = 0;
    std::optional<std::string> value = ADMGetSubElementValue(node, name, &count);
    if (count != 1)
        raiseMalformed("Required subelement ", name, " missing"); // Kept: also for two and more
    return *std::move(value);
}

std::map<std::string, std::string> ADMGetLabelsDictionary(const XMLNode& node, std::string_view name)
{
    std::map<std::string, std::string> labels;
    for (const XMLNode& child : node.elementsForName(name))
        if (auto language = ADMGetAttribute(child, "language"))
            labels[*std::move(language)] = child.stringValue();
    return labels;
}
