#include "project/ProjectLists.h"

#include "platform/PropertyList.h"

std::optional<platform::Dictionary> dictionaryFromBytes(BytesView bytes)
{
    auto value = platform::readPropertyList(bytes);
    auto* dictionary = value ? value->get<platform::Dictionary>() : nullptr;
    return dictionary != nullptr ? std::optional(std::move(*dictionary)) : std::nullopt;
}
