// The XML property list: one value within a "plist" element.
#pragma once

#include "platform/PropertyList.h"
#include "platform/core/Bytes.h"
#include "platform/core/Value.h"

#include <string>

namespace platform::plist {

/// False, with `problem`, if the text is not well-formed or is not a property list.
bool readXML(BytesView bytes, Value& value, std::string& problem, PropertyListReading reading);
/// False, with `problem`, if a list cannot hold the value or XML has no form for it.
bool writeXML(const Value& value, Bytes& bytes, std::string& problem);

} // namespace platform::plist
