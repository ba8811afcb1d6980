// How attributes and sub-elements are asked for: from the attributes that the parser hands over, or from a parsed tree.
// The functions that take a tree are for clients that hold one.
#pragma once

#include "platform/XMLNode.h"
#include "platform/core/Export.h"

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>

/// The text of an attribute; `defaultValue` when it is absent or empty. What the first form returns is a view of what
/// it was given.
KT_EXPORT std::optional<std::string_view> ADMGetAttribute(const platform::XMLAttributes& attributes,
                                                          std::string_view name,
                                                          std::optional<std::string_view> defaultValue = {});
KT_EXPORT std::optional<std::string> ADMGetAttribute(const platform::XMLNode& node, std::string_view name,
                                                     std::optional<std::string_view> defaultValue = {});

/// The same, but raises MalformedDefinition when the attribute is absent or empty.
KT_EXPORT std::string_view ADMGetRequiredAttribute(const platform::XMLAttributes& attributes, std::string_view name);
KT_EXPORT std::string ADMGetRequiredAttribute(const platform::XMLNode& node, std::string_view name);

/// The text of the first child of that name, null when there is none; `count` gets how many there are.
KT_EXPORT std::optional<std::string> ADMGetSubElementValue(const platform::XMLNode& node, std::string_view name,
                                                           std::size_t* count = nullptr);
/// The text of the only such child, `defaultValue` when there is none. Raises MalformedDefinition when there are more.
KT_EXPORT std::optional<std::string> ADMGetUniqueSubElementValue(const platform::XMLNode& node, std::string_view name,
                                                                 std::optional<std::string_view> defaultValue = {});
/// Raises MalformedDefinition unless there is exactly one.
KT_EXPORT std::string ADMGetRequiredUniqueSubElementValue(const platform::XMLNode& node, std::string_view name);

/// The texts of all children of that name, by their attribute "language". Those without one are left out; of one
/// language the last wins.
KT_EXPORT std::map<std::string, std::string> ADMGetLabelsDictionary(const platform::XMLNode& node,
                                                                    std::string_view name);
