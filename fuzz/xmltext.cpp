// Any document edited as text: what is named is then what it was set to, as a parser reads it, and all else as it was.
// The first byte says which edit, the second of which element.
#include "tool/meta/XMLText.h"
#include "platform/XMLParser.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cstdlib>

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

/// What a parser hears, in order: "<name", "@name=value" for each attribute, ">" of the end, "text".
struct Heard : platform::XMLHandler {
    std::vector<std::string> events;

    void startElement(std::string_view name, const platform::XMLAttributes& attributes) override
    {
        events.push_back("<" + std::string(name));
        for (const auto& [key, value] : attributes)
            events.push_back("@" + std::string(key) + "=" + std::string(value));
    }
    void endElement(std::string_view) override { events.emplace_back(">"); }
    void characters(std::string_view text) override
    {
        if (!isText(events.back()))
            events.emplace_back("\"");
        events.back() += text;
    }
    static bool isText(const std::string& event) { return event.front() == '"'; }
};

using Events = std::vector<std::string>;

Events heardIn(const std::string& document)
{
    Heard heard;
    platform::BorrowedInputStream stream(bytesOf(document));
    require(platform::XMLParser(stream, heard).parse());
    return heard.events;
}

/// Blanks around elements come and go with these; texts may be in one piece or in two.
std::string withoutBlanks(const Events& events)
{
    std::string all;
    for (const std::string& event : events) {
        std::string text = Heard::isText(event) ? event.substr(1) : event + "\n";
        if (Heard::isText(event))
            std::erase_if(text, [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; });
        all += text;
    }
    return all;
}

void collect(const XMLElement& element, std::vector<const XMLElement*>& elements)
{
    elements.push_back(&element);
    for (const XMLElement& child : element.children)
        collect(child, elements);
}

std::size_t startOf(const Events& events, std::size_t element)
{
    std::size_t at = 0;
    for (;; ++at)
        if (events[at].front() == '<' && element-- == 0)
            return at;
}

bool isASCII(std::string_view text)
{
    return std::ranges::all_of(text, [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

void edit(XMLText& document, unsigned how, std::size_t which)
{
    const std::string value = "a <b> & \"c\"\r\n\t'd' \xC3\xA9";
    std::vector<const XMLElement*> elements;
    collect(document.root(), elements);
    Events events = heardIn(document.text());
    require(std::ranges::count_if(events, [](const auto& each) { return each.front() == '<'; }) ==
            std::ssize(elements));
    which %= elements.size();
    const XMLElement& element = *elements[which];
    const auto start = events.begin() + static_cast<std::ptrdiff_t>(startOf(events, which));
    const auto content = std::find_if(start + 1, events.end(), [](const auto& each) { return each.front() != '@'; });
    auto end = content;
    for (int depth = 1; (depth += end->front() == '<' ? 1 : end->front() == '>' ? -1 : 0) != 0;)
        ++end;
    // Names beyond ASCII stand in the document's encoding, and are heard in UTF-8.
    require((*start == "<" + std::string(element.name) || !isASCII(element.name)) &&
            content - start - 1 == std::ssize(element.attributes));
    switch (how % 4) {
    case 0:
        document.setContent(element, value);
        events.insert(events.erase(content, end), "\"" + value);
        break;
    case 1:
        while (!element.children.empty() && *(end - 1) != ">") // behind the last child
            --end;
        events.insert(end, {"<new", ">"});
        document.addChild(element, "new");
        break;
    case 2:
        if (which == 0)
            return;
        document.remove(element);
        events.erase(start, end + 1);
        break;
    default:
        if (element.attributes.empty()) {
            document.setAttribute(element, "new", value);
            events.insert(start + 1, "@new=" + value);
        } else {
            const std::string name(element.attributes.back().name);
            if (!isASCII(name))
                return;
            document.setAttribute(element, name, value);
            *(content - 1) = "@" + name + "=" + value;
        }
    }
    require(withoutBlanks(heardIn(document.text())) == withoutBlanks(events));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size < 2)
        return 0;
    try {
        XMLText document(std::string(reinterpret_cast<const char*>(data) + 2, size - 2));
        edit(document, data[0], data[1]);
    } catch (const Failure&) { // what is not edited
    }
    return 0;
}
