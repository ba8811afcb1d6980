#include "tool/meta/MetaNames.h"

#include <charconv>

namespace {

std::optional<std::size_t> numberFrom(std::string_view text)
{
    std::size_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

} // namespace

bool MetaName::Part::isNew() const
{
    constexpr std::string_view word = "new";
    return index == word || (index.starts_with(word) && numberFrom(std::string_view(index).substr(word.size())));
}

std::optional<std::size_t> MetaName::Part::id() const
{
    constexpr std::string_view word = "id ";
    return index.starts_with(word) ? numberFrom(std::string_view(index).substr(word.size())) : std::nullopt;
}

std::optional<std::size_t> MetaName::Part::number() const
{
    return index.empty() ? 0 : numberFrom(index);
}

std::string MetaName::pattern(bool keepsFirst) const
{
    std::string pattern;
    for (const Part& part : parts) {
        const bool isFirst = &part == &parts.front();
        pattern += (isFirst ? "" : ".") + part.name + (part.index.empty() || (isFirst && !keepsFirst) ? "" : "[N]");
    }
    return pattern;
}

std::string MetaName::upTo(std::size_t part) const
{
    std::string name;
    for (std::size_t i = 0; i <= part && i < parts.size(); ++i)
        name += (i == 0 ? "" : ".") + parts[i].name + (parts[i].index.empty() ? "" : "[" + parts[i].index + "]");
    return name;
}

std::optional<MetaName> metaNameFromText(std::string_view text)
{
    MetaName name;
    name.text = text;
    if (const std::size_t dot = text.find('.'); dot != std::string_view::npos)
        name.rest = text.substr(dot + 1);
    for (bool goesOn = true; goesOn;) {
        MetaName::Part& part = name.parts.emplace_back();
        const std::size_t end = text.find_first_of(".[");
        part.name = text.substr(0, end);
        if (part.name.empty())
            return std::nullopt;
        text.remove_prefix(part.name.size());
        if (text.starts_with('[')) {
            const std::size_t close = text.find(']');
            if (close == std::string_view::npos || close == 1)
                return std::nullopt;
            part.index = text.substr(1, close - 1);
            text.remove_prefix(close + 1);
        }
        goesOn = text.starts_with('.');
        if (goesOn)
            text.remove_prefix(1);
        else if (!text.empty())
            return std::nullopt;
    }
    return name;
}
