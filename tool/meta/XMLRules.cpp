// Sets fields of "iXML" by the path of their element.
#include "tool/meta/MetaEdit.h"
#include "tool/meta/XMLText.h"

#include <fmt/format.h>

namespace {

constexpr FourCC kIXML = fourCC("iXML");
constexpr std::string_view kFresh = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<BWFXML>\n</BWFXML>\n";

bool isAttribute(const MetaName::Part& part)
{
    return part.name.starts_with('@');
}

/// The element at the step's path, created if it is to be set; null when removing one that does not exist.
const XMLElement* elementOf(MetaEdit& edit, const MetaStep& step, XMLText& document)
{
    const auto& parts = step.name.parts;
    const std::size_t depth = parts.size() - (isAttribute(parts.back()) ? 1 : 0);
    // Starts at the root for each part, because an insertion moves everything after it.
    std::vector<std::size_t> path;
    const auto elementAt = [&] {
        const XMLElement* element = &document.root();
        for (std::size_t i = 0; i < path.size(); ++i)
            element = element->named(parts[i + 1].name)[path[i]];
        return element;
    };
    for (std::size_t i = 1; i < depth; ++i) {
        if (!isXMLName(parts[i].name))
            MetaEdit::refuse(step, fmt::format("\"{}\" can be no name of an element", parts[i].name));
        const XMLElement* const parent = elementAt();
        const std::size_t count = parent->named(parts[i].name).size();
        if (parts[i].index.empty() && count > 1 && !step.isRemoval())
            MetaEdit::refuse(step, fmt::format("there are {}, {}[0] to [{}]", count, step.name.upTo(i), count - 1));
        const bool isFirst = parts[i].index.empty() && count == 0 && !step.isRemoval();
        const auto index = isFirst ? 0 : edit.itemOf(step, i, count);
        if (!index)
            return nullptr;
        if (*index == count)
            document.addChild(*parent, parts[i].name);
        path.push_back(*index);
    }
    return elementAt();
}

void setElement(MetaEdit& edit, const MetaStep& step)
{
    MetaChunk* const chunk = edit.chunkOf(step, kIXML);
    if (chunk == nullptr && step.isRemoval())
        return;
    const std::string_view body = chunk != nullptr ? textOf(chunk->body) : kFresh;
    const std::string_view text = body.substr(0, body.find_last_not_of('\0') + 1);
    XMLText document{std::string(text)};
    const XMLElement* const element = elementOf(edit, step, document);
    if (element == nullptr)
        return;
    const MetaName::Part& last = step.name.parts.back();
    if (isAttribute(last)) {
        const std::string_view name = std::string_view(last.name).substr(1);
        if (!isXMLName(name))
            MetaEdit::refuse(step, fmt::format("\"{}\" can be no name of an attribute", name));
        if (step.isRemoval())
            document.removeAttribute(*element, name);
        else
            document.setAttribute(*element, name, step.string());
    } else if (step.isRemoval()) {
        if (!last.index.empty())
            edit.itemRemoved(step, step.name.parts.size() - 1);
        document.remove(*element);
    } else if (!element->children.empty()) {
        MetaEdit::refuse(
            step, fmt::format("it holds elements, such as {}.{}", step.name.text, element->children.front().name));
    } else {
        document.setContent(*element, step.string());
    }
    // A shorter document is padded as its writer does, so that it keeps its place.
    Bytes after(bytesOf(document.text()).begin(), bytesOf(document.text()).end());
    if (chunk == nullptr) {
        edit.add(kIXML, std::move(after));
        return;
    }
    const bool hasNULs = text.size() != body.size();
    if (after.size() < body.size())
        after.resize(body.size(), static_cast<std::byte>(hasNULs ? '\0' : ' '));
    if (after != chunk->body)
        edit.replace(*chunk, std::move(after));
}

constexpr MetaRule kXMLRules[] = {
    {"ixml", MetaKind::none, {}, removeChunk<kIXML>},
    {"ixml.*", MetaKind::text, kAnyLength, setElement},
};

} // namespace

std::span<const MetaRule> xmlRules()
{
    return kXMLRules;
}
