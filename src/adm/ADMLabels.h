// Labels of an element in several languages.
#pragma once

#include "platform/XMLParser.h"

#include <map>
#include <string>
#include <string_view>

/// Language to text.
using ADMLabels = std::map<std::string, std::string>;

namespace adm {

/// Stores a label under its "language"; one without is left out.
void addLabel(ADMLabels& labels, std::string_view value, const platform::XMLAttributes& attributes);

} // namespace adm
