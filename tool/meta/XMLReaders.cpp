// Chunks that hold XML documents.
#include "platform/XMLParser.h"
#include "tool/meta/MetaReaders.h"

#include <fmt/format.h>

#include <memory>

namespace {

struct Element {
    std::string name;
    std::string text;
    std::vector<std::pair<std::string, std::string>> attributes;
    std::vector<std::unique_ptr<Element>> children;
};

/// Keeps a document's elements; stops at more of them, or deeper ones, than fields are good for.
class TreeHandler : public platform::XMLHandler {
public:
    static constexpr int kMostElements = 100'000;
    static constexpr std::size_t kLongestPath = 1000;

    TreeHandler() { open_.push_back(&document); }
    void watch(platform::XMLParser& parser) { parser_ = &parser; }
    void startElement(std::string_view name, const platform::XMLAttributes& attributes) override
    {
        pathLength_ += name.size();
        if (++count_ > kMostElements || pathLength_ > kLongestPath)
            return parser_->abort();
        Element& element = *open_.back()->children.emplace_back(std::make_unique<Element>());
        element.name = name;
        for (const platform::XMLAttribute& attribute : attributes)
            element.attributes.emplace_back(attribute.name, attribute.value);
        open_.push_back(&element);
    }
    void endElement(std::string_view name) override
    {
        pathLength_ -= name.size();
        open_.pop_back();
    }
    void characters(std::string_view text) override { open_.back()->text += text; }

    Element document; // whose one child is the root

private:
    platform::XMLParser* parser_ = nullptr;
    std::vector<Element*> open_;
    int count_ = 0;
    std::size_t pathLength_ = 0; // of the names of the open elements
};

/// Writers fill chunks up with NULs.
BytesView withoutNULs(BytesView bytes)
{
    return bytes.first(textOf(bytes).find_last_not_of('\0') + 1);
}

bool parse(BytesView bytes, TreeHandler& handler)
{
    platform::BorrowedInputStream stream(withoutNULs(bytes));
    platform::XMLParser parser(stream, handler);
    handler.watch(parser);
    return parser.parse();
}

std::string_view trimmed(std::string_view text)
{
    constexpr std::string_view blanks = " \t\r\n";
    const std::size_t begin = text.find_first_not_of(blanks);
    return begin == std::string_view::npos ? "" : text.substr(begin, text.find_last_not_of(blanks) + 1 - begin);
}

/// Of several elements of a name each has its index, and in a list each always.
void addElements(const Element& parent, const std::string& path, MetaFields& fields)
{
    std::map<std::string_view, int> total, count;
    for (const auto& child : parent.children)
        ++total[child->name];
    for (const auto& child : parent.children) {
        std::string name = path + child->name;
        if (const int index = count[child->name]++; total[child->name] > 1 || parent.name.ends_with("_LIST"))
            name += child->name.ends_with("_COUNT") ? "" : fmt::format("[{}]", index);
        for (const auto& [attribute, value] : child->attributes)
            fields.text(name + ".@" + attribute, value);
        fields.text(name, trimmed(child->text));
        addElements(*child, name + ".", fields);
    }
}

} // namespace

bool readIXML(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    TreeHandler handler;
    if (!parse(chunk.body, handler))
        return readText(chunk, source, fields);
    addElements(*handler.document.children.front(), "", fields);
    return true;
}

bool readADM(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    struct Counter : platform::XMLHandler {
        void startElement(std::string_view name, const platform::XMLAttributes&) override
        {
            for (auto& [kind, count] : counts)
                count += kind == name ? 1U : 0U;
        }
        void endElement(std::string_view) override {}
        void characters(std::string_view) override {}
        std::vector<std::pair<std::string_view, std::uint64_t>> counts{
            {"audioProgramme", 0},     {"audioContent", 0},      {"audioObject", 0},      {"audioPackFormat", 0},
            {"audioChannelFormat", 0}, {"audioStreamFormat", 0}, {"audioTrackFormat", 0}, {"audioTrackUID", 0}};
    } counter;
    platform::BorrowedInputStream stream(withoutNULs(chunk.body));
    if (!platform::XMLParser(stream, counter).parse())
        return false;
    std::string summary;
    for (const auto& [kind, count] : counter.counts)
        if (count != 0)
            summary += fmt::format("{}{} {}", summary.empty() ? "" : ", ", count, kind);
    fields.text("", summary.empty() ? "no ADM elements" : summary);
    return true;
}
