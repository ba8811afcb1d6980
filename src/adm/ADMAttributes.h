// Attributes and sub-elements of ADM, read from what the parser hands over or, for clients that hold one, from a
// parsed tree.
#pragma once

#include "platform/XMLNode.h"
#include "platform/core/Export.h"

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>

/// The text of an attribute; `defaultValue` when it is absent or empty. The result is a view of `attributes`.
KT_EXPORT std::optional<std::string_view> ADMGetAttribute(const platform::XMLAttributes& attributes,
                                                          std::string_view name,
                                                          std::optional<std::string_view> defaultValue = {});
/// The text of an attribute of a tree's node, as a copy.
KT_EXPORT std::optional<std::string> ADMGetAttribute(const platform::XMLNode& node, std::string_view name,
                                                     std::optional<std::string_view> defaultValue = {});

/// The text of an attribute, as a view. Raises MalformedDefinition when it is absent or empty.
KT_EXPORT std::string_view ADMGetRequiredAttribute(const platform::XMLAttributes& attributes, std::string_view name);
/// The text of an attribute of a tree's node, as a copy. Raises MalformedDefinition when it is absent or empty.
KT_EXPORT std::string ADMGetRequiredAttribute(const platform::XMLNode& node, std::string_view name);

/// The text of the first child named `name`, null when there is none; `count` gets the number of such children.
KT_EXPORT std::optional<std::string> ADMGetSubElementValue(const platform::XMLNode& node, std::string_view name,
                                                           std::size_t* count = nullptr);
/// The text of the only child named `name`, `defaultValue` when there is none. Raises MalformedDefinition for two and
/// more.
KT_EXPORT std::optional<std::string> ADMGetUniqueSubElementValue(const platform::XMLNode& node, std::string_view name,
                                                                 std::optional<std::string_view> defaultValue = {});
/// The text of the only child named `name`. Raises MalformedDefinition unless there is exactly one.
KT_EXPORT std::string ADMGetRequiredUniqueSubElementValue(const platform::XMLNode& node, std::string_view name);

/// The texts of all children named `name`, by their attribute "language". Children without one are left out; the last
/// of a language wins.
KT_EXPORT std::map<std::string, std::string> ADMGetLabelsDictionary(const platform::XMLNode& node,
                                                                    std::string_view name);
