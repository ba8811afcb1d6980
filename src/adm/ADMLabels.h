// Labels of an element in several languages.
#pragma once

#include "platform/XMLParser.h"

#include <map>
#include <string>
#include <string_view>

/// Language code to text.
using ADMLabels = std::map<std::string, std::string>;

namespace adm {

/// Stores a label under its attribute "language", in the place of an earlier one; without that attribute it is
/// ignored.
void addLabel(ADMLabels& labels, std::string_view value, const platform::XMLAttributes& attributes);

} // namespace adm
