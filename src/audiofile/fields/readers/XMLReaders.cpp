// Reads chunks that hold XML documents.
#include "audiofile/fields/readers/MetaReaders.h"
#include "platform/XMLParser.h"

#include <algorithm>
#include <deque>
#include <memory_resource>

namespace {

using Memory = std::pmr::memory_resource;

struct Element {
    explicit Element(Memory* memory) : text(memory), attributes(memory) {}

    std::string_view name;
    std::pmr::string text; // without leading blanks
    std::pmr::vector<std::pair<std::string_view, std::string_view>> attributes;
    std::size_t depth = 0;              // 0 for the root
    std::size_t index = 0;              // among siblings of the same name
    const std::size_t* likes = nullptr; // number of those siblings
    bool isInList = false;              // according to its parent's name
};
using Elements = std::pmr::deque<Element>; // in order of their start; addresses are stable

constexpr std::string_view kBlanks = " \t\r\n";

/// Collects a document's elements; stops beyond a sensible number or depth.
class TreeHandler : public platform::XMLHandler {
public:
    static constexpr std::size_t kMostElements = 100'000;
    static constexpr std::size_t kLongestPath = 1000;

    void watch(platform::XMLParser& parser) { parser_ = &parser; }
    const Elements& elements() const { return elements_; }
    void startElement(std::string_view name, const platform::XMLAttributes& attributes) override
    {
        pathLength_ += name.size();
        if (elements_.size() == kMostElements || pathLength_ > kLongestPath)
            return parser_->abort();
        const Element* const parent = open_.empty() ? nullptr : open_.back();
        Element& element = elements_.emplace_back(&memory_);
        element.name = kept(name);
        element.depth = open_.size();
        element.isInList = parent != nullptr && parent->name.ends_with("_LIST");
        std::size_t& likes = likes_[{parent, element.name}];
        element.index = likes++;
        element.likes = &likes;
        for (const platform::XMLAttribute& attribute : attributes)
            element.attributes.emplace_back(kept(attribute.name), kept(attribute.value));
        open_.push_back(&element);
    }
    void endElement(std::string_view name) override
    {
        pathLength_ -= name.size();
        open_.pop_back();
    }
    void characters(std::string_view text) override
    {
        std::pmr::string& all = open_.back()->text;
        if (all.empty())
            text.remove_prefix(std::min(text.find_first_not_of(kBlanks), text.size()));
        all += text;
    }

private:
    std::string_view kept(std::string_view text)
    {
        auto* const to = static_cast<char*>(memory_.allocate(text.size() + 1, 1));
        return {to, text.copy(to, text.size())};
    }

    std::pmr::monotonic_buffer_resource memory_; // freed at once, which is faster than many small pieces
    Elements elements_{&memory_};
    std::pmr::map<std::pair<const Element*, std::string_view>, std::size_t> likes_{&memory_}; // by parent and name
    std::vector<Element*> open_;
    std::size_t pathLength_ = 0; // length of the names of the open elements
    platform::XMLParser* parser_ = nullptr;
};

/// Writers pad chunks with NULs.
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

/// Elements with siblings of the same name have an index, and elements in a list always do.
bool hasIndex(const Element& element)
{
    return (*element.likes > 1 || element.isInList) && !element.name.ends_with("_COUNT");
}

/// The root stands for the document and is not part of a path.
void addElements(const Elements& elements, MetaFields& fields)
{
    std::string path;
    std::vector<std::size_t> ends; // end of the path of the open element at each depth
    for (const Element& element : elements) {
        ends.resize(element.depth + 1);
        path.resize(element.depth == 0 ? 0 : ends[element.depth - 1]);
        if (element.depth != 0) {
            if (!path.empty())
                path += '.';
            path += element.name;
            if (hasIndex(element))
                appendIndex(path, element.index);
        }
        ends.back() = path.size();
        for (const auto& [attribute, value] : element.attributes) {
            (path += path.empty() ? "@" : ".@") += attribute;
            fields.text(path, value);
            path.resize(ends.back());
        }
        fields.text(path, std::string_view(element.text).substr(0, element.text.find_last_not_of(kBlanks) + 1));
    }
}

} // namespace

bool readIXML(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    TreeHandler handler;
    if (!parse(chunk.body, handler))
        return readText(chunk, source, fields);
    addElements(handler.elements(), fields);
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
            (summary += (summary.empty() ? "" : ", ") + std::to_string(count) + " ") += kind;
    fields.text("", summary.empty() ? "no ADM elements" : summary);
    return true;
}
