// The XML property list: one value within a "plist" element.
#pragma once

#include "platform/PropertyList.h"
#include "platform/core/Bytes.h"
#include "platform/core/Value.h"

#include <string>

namespace platform::plist {

/// False, with `problem`, when the text is not well-formed or no property list.
bool readXML(BytesView bytes, Value& value, std::string& problem, PropertyListReading reading);
/// False, with `problem`, when the value is none that a list can hold, or XML has no form for it.
bool writeXML(const Value& value, Bytes& bytes, std::string& problem);

} // namespace platform::plist
