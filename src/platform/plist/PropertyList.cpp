#include "platform/PropertyList.h"

#include "platform/core/Status.h"
#include "platform/plist/PropertyListBinary.h"
#include "platform/plist/PropertyListXML.h"

namespace platform {

namespace {

bool isBinary(BytesView bytes)
{
    return textOf(bytes).starts_with("bplist");
}

/// Whether the bytes may be XML: they begin with a byte order mark, or with "<" after any white space.
bool mayBeXML(BytesView bytes)
{
    const std::string_view text = textOf(bytes);
    for (const std::string_view mark : {"\xEF\xBB\xBF", "\xFE\xFF", "\xFF\xFE"})
        if (text.starts_with(mark))
            return true;
    const auto first = text.find_first_not_of(" \t\r\n");
    return first != text.npos && text[first] == '<';
}

} // namespace

std::optional<Bytes> writePropertyList(const Value& value, PropertyListFormat format, Error* error)
{
    Bytes bytes;
    std::string problem;
    const auto write = format == PropertyListFormat::xml ? plist::writeXML : plist::writeBinary;
    if (write(value, bytes, problem))
        return bytes;
    fail(error, ErrorDomain::status, kStatusParameterError, "property list: " + problem);
    return std::nullopt;
}

std::optional<Value> readPropertyList(BytesView bytes, Error* error, PropertyListReading reading)
{
    Value value;
    std::string problem = "neither XML nor the binary format";
    const bool isRead = isBinary(bytes) ? plist::readBinary(bytes, value, problem, reading)
                                        : mayBeXML(bytes) && plist::readXML(bytes, value, problem, reading);
    if (isRead && !value.isNull())
        return value;
    if (isRead)
        problem = "its only value cannot be read";
    fail(error, ErrorDomain::status, kStatusParameterError, "property list: " + problem);
    return std::nullopt;
}

} // namespace platform
