#include "platform/KeyedArchive.h"

#include "platform/PropertyList.h"

namespace platform {

std::optional<Bytes> archiveDictionary(const Dictionary& dictionary)
{
    return writePropertyList(dictionary, PropertyListFormat::binary);
}

std::optional<Dictionary> unarchiveDictionary(BytesView archive)
{
    std::optional<Value> value = readPropertyList(archive);
    Dictionary* dictionary = value ? value->get<Dictionary>() : nullptr;
    if (dictionary == nullptr)
        return std::nullopt;
    return std::move(*dictionary);
}

} // namespace platform
