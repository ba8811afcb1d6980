#include "tool/meta/XMLText.h"

#include "platform/XMLParser.h"
#include "platform/core/ASCIICase.h"
#include "platform/core/UTF8.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>

namespace {

constexpr std::string_view kXMLBlanks = " \t\r\n";

bool isWellFormed(const std::string& document)
{
    struct Silent : platform::XMLHandler {
        void startElement(std::string_view, const platform::XMLAttributes&) override {}
        void endElement(std::string_view) override {}
        void characters(std::string_view) override {}
    } handler;
    platform::BorrowedInputStream stream(bytesOf(document));
    return platform::XMLParser(stream, handler).parse();
}

/// The encoding in the declaration; empty if it states none.
std::string_view encodingOf(std::string_view document)
{
    if (!document.starts_with("<?xml"))
        return {};
    document = document.substr(0, document.find("?>"));
    const std::size_t at = document.find("encoding");
    const std::size_t quote = at == std::string_view::npos ? at : document.find_first_of("\"'", at);
    if (quote == std::string_view::npos)
        return {};
    const std::size_t end = document.find(document[quote], quote + 1);
    return document.substr(quote + 1, end - quote - 1);
}

/// Scans a well-formed tag: its attributes, and the position after its ">".
std::size_t scanTag(std::string_view text, std::size_t at, XMLElement& element)
{
    for (;;) {
        at = text.find_first_not_of(kXMLBlanks, at);
        if (text[at] == '>' || text[at] == '/')
            return text.find('>', at) + 1;
        XMLElement::Attribute attribute;
        const std::size_t nameEnd = text.find_first_of(" \t\r\n=", at);
        attribute.name = text.substr(at, nameEnd - at);
        const std::size_t quote = text.find_first_of("\"'", nameEnd);
        attribute.begin = quote + 1;
        attribute.end = text.find(text[quote], attribute.begin);
        at = attribute.end + 1;
        element.attributes.push_back(attribute);
    }
}

/// The end of a comment, CDATA section or instruction that begins here; npos if it is an element's tag.
std::size_t behindOther(std::string_view text, std::size_t at)
{
    using namespace std::string_view_literals;
    for (const auto& [begin, end] : {std::pair{"<!--"sv, "-->"sv}, {"<![CDATA["sv, "]]>"sv}, {"<?"sv, "?>"sv}})
        if (text.substr(at).starts_with(begin))
            return text.find(end, at + begin.size()) + end.size();
    return std::string_view::npos;
}

} // namespace

std::vector<const XMLElement*> XMLElement::named(std::string_view child) const
{
    std::vector<const XMLElement*> found;
    for (const XMLElement& each : children)
        if (each.name == child)
            found.push_back(&each);
    return found;
}

XMLText::XMLText(std::string document) : text_(std::move(document))
{
    const std::string_view encoding = encodingOf(text_);
    const bool isUTF8 = encoding.empty() || equalIgnoringASCIICase(encoding, "utf-8");
    takesUTF8_ = isUTF8;
    if (!isUTF8 && !equalIgnoringASCIICase(encoding, "us-ascii") && !equalIgnoringASCIICase(encoding, "iso-8859-1"))
        throw Failure(fmt::format("its XML is in {}, and only ASCII, Latin-1 and UTF-8 are edited", encoding));
    if (text_.find('\0') != std::string::npos || !isWellFormed(text_))
        throw Failure("its XML is not well-formed, and is edited by nobody who does not know what was meant");
    if (text_.find("<!DOCTYPE") != std::string::npos)
        throw Failure("its XML has a DOCTYPE, and is not edited by field");
    scan();
}

void XMLText::scan()
{
    const std::string_view text = text_;
    root_ = {};
    XMLElement document;
    std::vector<XMLElement*> open{&document};
    for (std::size_t at = text.find('<'); at != std::string_view::npos; at = text.find('<', at)) {
        if (const std::size_t behind = behindOther(text, at); behind != std::string_view::npos) {
            at = behind;
        } else if (text[at + 1] == '/') {
            open.back()->contentEnd = at;
            at = open.back()->end = text.find('>', at) + 1;
            open.pop_back();
        } else {
            XMLElement& element = open.back()->children.emplace_back();
            element.begin = at;
            const std::size_t nameEnd = text.find_first_of(" \t\r\n/>", at);
            element.name = text.substr(at + 1, nameEnd - at - 1);
            at = element.content = scanTag(text, nameEnd, element);
            if (text[at - 2] == '/')
                element.contentEnd = element.end = at;
            else
                open.push_back(&element);
        }
    }
    root_ = std::move(document.children.front());
}

void XMLText::change(std::size_t begin, std::size_t end, std::string_view by)
{
    text_.replace(begin, end - begin, std::string(by)); // a copy, because `by` may refer to the text
    scan();
}

std::string XMLText::escaped(std::string_view value, bool isAttribute) const
{
    std::string text;
    while (!value.empty()) {
        const char c = value.front();
        if (static_cast<unsigned char>(c) >= 0x80) {
            const std::string_view before = value;
            const char32_t code = platform::takeCharacter(value);
            if (takesUTF8_)
                text += before.substr(0, before.size() - value.size());
            else
                text += fmt::format("&#{};", static_cast<std::uint32_t>(code));
            continue;
        }
        value.remove_prefix(1);
        if (static_cast<unsigned char>(c) < 0x20 && kXMLBlanks.find(c) == std::string_view::npos)
            throw Failure("XML has no control characters");
        if (c == '&')
            text += "&amp;";
        else if (c == '<')
            text += "&lt;";
        else if (c == '>')
            text += "&gt;";
        else if (c == '\r' || (isAttribute && (c == '"' || c == '\n' || c == '\t')))
            text += fmt::format("&#{};", static_cast<int>(c));
        else
            text += c;
    }
    return text;
}

void XMLText::setContent(const XMLElement& element, std::string_view value)
{
    const std::string text = escaped(value, false);
    if (!element.isOneTag())
        return change(element.content, element.contentEnd, text);
    const std::size_t slash = text_.rfind('/', element.end - 1);
    change(slash, element.end, ">" + text + "</" + std::string(element.name) + ">");
}

void XMLText::setAttribute(const XMLElement& element, std::string_view name, std::string_view value)
{
    const auto found = std::ranges::find(element.attributes, name, &XMLElement::Attribute::name);
    std::string text = escaped(value, true);
    if (found == element.attributes.end()) {
        requireWritable(name);
        const std::size_t at = element.begin + 1 + element.name.size();
        return change(at, at, fmt::format(" {}=\"{}\"", name, text));
    }
    if (text_[found->end] == '\'')
        for (std::size_t quote = text.find('\''); quote != std::string::npos; quote = text.find('\'', quote))
            text.replace(quote, 1, "&#39;");
    change(found->begin, found->end, text);
}

/// Names are searched for in UTF-8, as typed, so they are not found in other encodings.
void XMLText::requireWritable(std::string_view name) const
{
    if (!takesUTF8_ && std::ranges::any_of(name, [](char c) { return static_cast<unsigned char>(c) >= 0x80; }))
        throw Failure("its XML is not in UTF-8, and takes ASCII names only");
}

void XMLText::addChild(const XMLElement& parent, std::string_view name)
{
    requireWritable(name);
    const std::string child = fmt::format("<{0}></{0}>", name);
    if (parent.isOneTag()) {
        const std::size_t slash = text_.rfind('/', parent.end - 1);
        return change(slash, parent.end, ">" + child + "</" + std::string(parent.name) + ">");
    }
    if (parent.children.empty())
        return change(parent.contentEnd, parent.contentEnd, child);
    const XMLElement& last = parent.children.back();
    const std::size_t blank = text_.find_last_not_of(kXMLBlanks, last.begin - 1) + 1;
    change(last.end, last.end, text_.substr(blank, last.begin - blank) + child);
}

void XMLText::remove(const XMLElement& element)
{
    const std::size_t blank = text_.find_last_not_of(kXMLBlanks, element.begin - 1) + 1;
    change(text_[blank - 1] == '>' ? blank : element.begin, element.end, "");
}

void XMLText::removeAttribute(const XMLElement& element, std::string_view name)
{
    const auto found = std::ranges::find(element.attributes, name, &XMLElement::Attribute::name);
    if (found == element.attributes.end())
        return;
    const std::size_t nameAt = static_cast<std::size_t>(found->name.data() - text_.data());
    change(text_.find_last_not_of(kXMLBlanks, nameAt - 1) + 1, found->end + 1, "");
}

bool isXMLName(std::string_view name)
{
    const auto isLetter = [](char c) {
        return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' || static_cast<unsigned char>(c) >= 0x80;
    };
    const auto isInName = [&](char c) { return isLetter(c) || (c >= '0' && c <= '9') || c == '-' || c == ':'; };
    return !name.empty() && isLetter(name.front()) && std::ranges::all_of(name, isInName);
}
