#include "project/ProjectLists.h"

std::optional<platform::Dictionary> dictionaryFromBytes(BytesView bytes, platform::PropertyListReading reading)
{
    auto value = platform::readPropertyList(bytes, nullptr, reading);
    auto* dictionary = value ? value->get<platform::Dictionary>() : nullptr;
    return dictionary != nullptr ? std::optional(std::move(*dictionary)) : std::nullopt;
}
