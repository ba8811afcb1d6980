// What reads as a property list must write and read back equal, in either format, and must not outgrow its bytes.
#include "platform/PropertyList.h"

#include <cstdint>
#include <cstdlib>

using namespace platform;

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

/// The memory that a value holds, apart from what the allocator adds.
std::size_t memoryOf(const Value& value)
{
    std::size_t memory = sizeof value;
    if (const auto* text = value.get<std::string>())
        memory += text->size();
    if (const auto* data = value.get<Bytes>())
        memory += data->size();
    if (const auto* array = value.get<Array>())
        for (const Value& element : *array)
            memory += memoryOf(element);
    if (const auto* dictionary = value.get<Dictionary>())
        for (const auto& [key, content] : *dictionary)
            memory += sizeof key + key.size() + memoryOf(content);
    return memory;
}

/// Texts are compared, not values: a NaN equals nothing.
Bytes writeReadWrite(const Value& value, PropertyListFormat format)
{
    const auto written = writePropertyList(value, format);
    require(written.has_value());
    const auto read = readPropertyList(*written);
    require(read.has_value());
    require(writePropertyList(*read, format) == written);
    return *written;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    Error error;
    const BytesView bytes = std::as_bytes(std::span(data, size));
    const auto value = readPropertyList(bytes, &error);
    require(value.has_value() == error.description.empty());
    if (!value)
        return 0;
    require(memoryOf(*value) <= 256 * size + 65536);

    writeReadWrite(*value, PropertyListFormat::binary);
    // XML has no form for some of what the binary format holds, but for all that came from XML.
    if (!textOf(bytes).starts_with("bplist") || writePropertyList(*value, PropertyListFormat::xml))
        writeReadWrite(*value, PropertyListFormat::xml);
    return 0;
}
