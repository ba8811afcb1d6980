#include "platform/XMLParser.h"

#include "platform/core/Status.h"
#include "platform/libxml2/XMLInput.h"

#include <algorithm>
#include <array>
#include <exception>
#include <forward_list>
#include <new>
#include <string>
#include <utility>
#include <vector>

#include <libxml/parser.h>
#include <libxml/parserInternals.h>

namespace platform {

namespace {

// The parser compares every attribute of a tag with every other, so a longer tag is refused to keep time in proportion
// to the bytes.
constexpr std::size_t kLongestTag = 16 * 1024;
// Reading stops where a tag is certainly too long; the bytes that are read for a tag may begin before it.
constexpr std::size_t kLongestRead = 2 * kLongestTag;
// The parser searches all namespaces in force for a prefix.
constexpr int kMostNamespaces = 256;
// The parser keeps every name until the end, in a few thousand lists; a million different names would take minutes.
constexpr int kMostNames = 10'000;
// The parser limits comments to this size, but not white space around the root element, which stays in its buffer.
constexpr std::size_t kLongestAroundRoot = 10'000'000;

std::string_view viewOf(const xmlChar* text)
{
    return reinterpret_cast<const char*>(text);
}

std::string_view viewOf(const xmlChar* begin, const xmlChar* end)
{
    return {reinterpret_cast<const char*>(begin), static_cast<std::size_t>(end - begin)};
}

/// Adds line and column to an error.
void addPosition(Error& error, XMLPosition position)
{
    error.userInfo["line"] = position.line;
    error.userInfo["column"] = position.column;
}

} // namespace

/// Pulls the bytes for libxml2 and passes its events to the handler. No exception crosses the C library's frames.
class XMLParser::Implementation {
public:
    Implementation(InputStream& stream, XMLHandler& handler) : input_(stream), handler_(handler) {}

    bool parse(Error* error);
    void abort();
    XMLPosition position() const;
    XMLPosition elementPosition() const;
    libxml2::XMLInput& input() { return input_; }
    void setMaximumDepth(int depth) { maximumDepth_ = depth; }

private:
    static xmlSAXHandler handlers();
    static void onStart(void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar* uri, int namespaces,
                        const xmlChar** namespacePairs, int attributes, int defaulted, const xmlChar** attributeRows);
    static void onEnd(void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar* uri);
    static void onCharacters(void* self, const xmlChar* text, int length);
    static void onError(void* self, xmlErrorPtr error);
    static int onRead(void* self, char* buffer, int length);
    static void onProcessingInstruction(void* self, const xmlChar* target, const xmlChar* data);
    static void refuseDeclaration(void* self);
    static xmlEntityPtr refuseEntity(void* self, const xmlChar* name);

    template <class Event>
    void handle(Event event)
    {
        stretch_ = 0;
        guard(event);
    }
    template <class Work>
    void guard(Work work)
    {
        if (stopped_)
            return;
        try {
            work();
        } catch (...) {
            thrown_ = std::current_exception();
            stop();
        }
    }
    void start(const xmlChar* name, const xmlChar* prefix, int namespaces, const xmlChar** namespacePairs,
               int attributes, const xmlChar** attributeRows, std::size_t bytesRead);
    /// The qualified name, joined from the two parts into which the parser splits it; valid during the event.
    std::string_view written(const xmlChar* prefix, const xmlChar* name)
    {
        if (prefix == nullptr) [[likely]]
            return nameAt(name);
        return ((keptNames_.emplace_front(viewOf(prefix)) += ':') += viewOf(name));
    }
    /// The parser keeps one copy of each name until the end, and most names have the length that they had before.
    std::string_view nameAt(const xmlChar* name)
    {
        std::string_view& met = metNames_[reinterpret_cast<std::uintptr_t>(name) / 4 % metNames_.size()];
        if (met.data() != reinterpret_cast<const char*>(name))
            met = viewOf(name);
        return met;
    }
    void fail(std::int64_t code, std::string_view message);
    void stop();
    std::string_view read(std::size_t most);
    void refuseManyNames();
    std::size_t longestStretch() const;
    void refuseLongStretch();
    void refuseLongTag();

    struct FreeContext {
        void operator()(xmlParserCtxtPtr context) const
        {
            if (context->myDoc != nullptr)
                xmlFreeDoc(context->myDoc);
            xmlFreeParserCtxt(context);
        }
    };

    libxml2::XMLInput input_;
    XMLHandler& handler_;
    std::vector<XMLAttribute> attributes_;     // of the element that begins
    std::forward_list<std::string> keptNames_; // names that had to be joined
    std::array<std::string_view, 64> metNames_;
    int maximumDepth_ = kXMLMaximumDepth;
    std::vector<int> namespaces_{0}; // in force at each depth, from outside the root on
    std::size_t stretch_ = 0;        // bytes read since the last event
    std::size_t longestStretch_ = 0; // limit of stretch_ where the parser stands
    bool stopped_ = false;
    std::optional<Error> error_;
    std::exception_ptr thrown_;
    std::unique_ptr<xmlParserCtxt, FreeContext> context_;
};

xmlSAXHandler XMLParser::Implementation::handlers()
{
    xmlSAXHandler sax{};
    sax.initialized = XML_SAX2_MAGIC; // prevents calls of the process-wide error handlers
    sax.startElementNs = onStart;
    sax.endElementNs = onEnd;
    // One function for both saves the parser the check for white space.
    sax.characters = sax.ignorableWhitespace = sax.cdataBlock = onCharacters;
    sax.comment = [](void* self, const xmlChar*) { static_cast<Implementation*>(self)->stretch_ = 0; };
    sax.processingInstruction = onProcessingInstruction;
    sax.getEntity = sax.getParameterEntity = refuseEntity;
    sax.entityDecl = [](void* s, const xmlChar*, int, const xmlChar*, const xmlChar*, xmlChar*) {
        refuseDeclaration(s);
    };
    sax.unparsedEntityDecl = [](void* s, const xmlChar*, const xmlChar*, const xmlChar*, const xmlChar*) {
        refuseDeclaration(s);
    };
    sax.notationDecl = [](void* s, const xmlChar*, const xmlChar*, const xmlChar*) { refuseDeclaration(s); };
    sax.elementDecl = [](void* s, const xmlChar*, int, xmlElementContentPtr) { refuseDeclaration(s); };
    sax.attributeDecl = [](void* s, const xmlChar*, const xmlChar*, int, int, const xmlChar*,
                           xmlEnumerationPtr values) {
        xmlFreeEnumeration(values); // the handler owns it
        refuseDeclaration(s);
    };
    sax.serror = onError;
    return sax;
}

void XMLParser::Implementation::onStart(void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar*,
                                        int namespaces, const xmlChar** namespacePairs, int attributes, int,
                                        const xmlChar** attributeRows)
{
    auto& parser = *static_cast<Implementation*>(self);
    const std::size_t bytesRead = parser.stretch_;
    parser.handle(
        [&] { parser.start(name, prefix, namespaces, namespacePairs, attributes, attributeRows, bytesRead); });
}

void XMLParser::Implementation::start(const xmlChar* name, const xmlChar* prefix, int namespaces,
                                      const xmlChar** namespacePairs, int attributes, const xmlChar** attributeRows,
                                      std::size_t bytesRead)
{
    // The parser reports a tag that is cut off, or that holds what no tag may hold, before its error.
    const xmlChar* behind = context_->input->cur;
    if (behind[0] != '>' && !(behind[0] == '/' && behind[1] == '>'))
        return;
    if (namespaces_.size() > static_cast<std::size_t>(maximumDepth_))
        return fail(XML_ERR_INTERNAL_ERROR, "elements are nested too deeply");
    namespaces_.push_back(namespaces_.back() + namespaces);
    if (namespaces_.back() > kMostNamespaces)
        return fail(XML_ERR_INTERNAL_ERROR, "too many namespaces are in force");
    refuseManyNames();
    if (bytesRead > kLongestTag / 2) // at most the other half was read before
        refuseLongTag();
    if (stopped_)
        return;

    keptNames_.clear();
    attributes_.resize(static_cast<std::size_t>(attributes));
    for (XMLAttribute& attribute : attributes_) {
        attribute = {written(attributeRows[1], attributeRows[0]), viewOf(attributeRows[3], attributeRows[4])};
        attributeRows += 5;
    }
    for (const xmlChar** pair = namespacePairs; pair != namespacePairs + 2 * namespaces; pair += 2) {
        const auto* xmlns = reinterpret_cast<const xmlChar*>("xmlns");
        attributes_.push_back({pair[0] == nullptr ? viewOf(xmlns) : written(xmlns, pair[0]),
                               pair[1] == nullptr ? std::string_view() : viewOf(pair[1])});
    }
    handler_.startElement(written(prefix, name), attributes_);
}

void XMLParser::Implementation::onEnd(void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar*)
{
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] {
        parser.namespaces_.pop_back();
        parser.keptNames_.clear();
        parser.handler_.endElement(parser.written(prefix, name));
    });
}

void XMLParser::Implementation::onCharacters(void* self, const xmlChar* text, int length)
{
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] { parser.handler_.characters(viewOf(text, text + length)); });
}

void XMLParser::Implementation::onError(void* self, xmlErrorPtr error)
{
    // Errors that are not fatal leave the document well-formed. Names are taken as written, whatever namespaces say.
    if (error->level != XML_ERR_FATAL || error->domain == XML_FROM_NAMESPACE)
        return;
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] {
        std::string message = error->message == nullptr ? "" : error->message;
        while (message.ends_with('\n'))
            message.pop_back();
        std::replace(message.begin(), message.end(), '\n', ' ');
        // The message quotes the document, whose names may have any length.
        parser.fail(error->code, message.empty() || message.size() > 200 ? "it is not well-formed" : message);
    });
}

void XMLParser::Implementation::refuseDeclaration(void* self)
{
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] { parser.fail(XML_ERR_INTERNAL_ERROR, "a declaration inside the DOCTYPE"); });
}

/// Called for every entity that is not predefined.
xmlEntityPtr XMLParser::Implementation::refuseEntity(void* self, const xmlChar*)
{
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] { parser.fail(XML_ERR_UNDECLARED_ENTITY, "an entity that is not predefined"); });
    return nullptr;
}

void XMLParser::Implementation::onProcessingInstruction(void* self, const xmlChar*, const xmlChar*)
{
    auto& parser = *static_cast<Implementation*>(self);
    parser.handle([&] { parser.refuseManyNames(); });
}

int XMLParser::Implementation::onRead(void* self, char* buffer, int length)
{
    auto& parser = *static_cast<Implementation*>(self);
    std::string_view text;
    parser.guard([&] { text = parser.read(static_cast<std::size_t>(length)); });
    std::copy(text.begin(), text.end(), buffer);
    return static_cast<int>(text.size());
}

/// Returns nothing once parsing is stopped, which ends the document for the parser. It must not be stopped by force
/// while it holds pointers into its buffer.
std::string_view XMLParser::Implementation::read(std::size_t most)
{
    refuseLongStretch();
    if (stopped_)
        return {};
    const std::string_view text = input_.next(most);
    stretch_ += text.size();
    return text;
}

/// How many bytes may be read without an event in the parser's current state; 0 for no limit: comments, CDATA sections
/// and processing instructions come whole, and libxml2 limits them itself. Text comes in small pieces.
std::size_t XMLParser::Implementation::longestStretch() const
{
    switch (context_->instate) {
    case XML_PARSER_COMMENT:
    case XML_PARSER_CDATA_SECTION:
    case XML_PARSER_PI:
        return 0;
    case XML_PARSER_CONTENT:
    case XML_PARSER_ATTRIBUTE_VALUE:
        return kLongestRead;
    default:
        return kLongestAroundRoot;
    }
}

void XMLParser::Implementation::refuseLongStretch()
{
    if (context_ == nullptr)
        return;
    const std::size_t longest = longestStretch();
    if (longest != std::exchange(longestStretch_, longest))
        stretch_ = 0;
    if (longest == 0 || stretch_ <= longest)
        return;
    if (longest == kLongestRead)
        fail(XML_ERR_ATTRIBUTE_NOT_FINISHED, "a tag is too long");
    else
        fail(XML_ERR_INTERNAL_ERROR, "there is too much around the root element");
}

/// Called at the end of a tag; counts only the tag's own bytes.
void XMLParser::Implementation::refuseLongTag()
{
    const std::string_view behind = viewOf(context_->input->base, context_->input->cur);
    const std::size_t begin = behind.rfind('<');
    const std::size_t end = context_->input->cur[0] == '>' ? 1 : 2; // ">" or "/>"
    if (begin == behind.npos || behind.size() - begin + end > kLongestTag)
        fail(XML_ERR_ATTRIBUTE_NOT_FINISHED, "a tag is too long");
}

void XMLParser::Implementation::refuseManyNames()
{
    if (xmlDictSize(context_->dict) > kMostNames)
        fail(XML_ERR_INTERNAL_ERROR, "too many different names");
}

void XMLParser::Implementation::fail(std::int64_t code, std::string_view message)
{
    if (!error_) {
        platform::fail(&error_.emplace(), kXMLErrorDomain, code, std::string(message));
        addPosition(*error_, position());
    }
    stop();
}

void XMLParser::Implementation::stop()
{
    stopped_ = true;
    if (context_ != nullptr)
        context_->disableSAX = 1;
}

void XMLParser::Implementation::abort()
{
    if (!error_)
        platform::fail(&error_.emplace(), ErrorDomain::status, kStatusUserCancelled, StatusText(kStatusUserCancelled));
    stop();
}

bool XMLParser::Implementation::parse(Error* error)
{
    xmlInitParser();
    xmlSAXHandler sax = handlers();
    metNames_.fill({});
    context_.reset(xmlCreateIOParserCtxt(&sax, this, onRead, nullptr, this, XML_CHAR_ENCODING_NONE));
    if (context_ == nullptr)
        throw std::bad_alloc();
    // Pulled rather than pushed, because the push parser is quadratic in long CDATA sections. XML_PARSE_NOENT replaces
    // the predefined entities, the only ones allowed: without it "&amp;" in an attribute would be passed on as "&#38;".
    const int huge = maximumDepth_ > kXMLMaximumDepth ? XML_PARSE_HUGE : 0;
    xmlCtxtUseOptions(context_.get(), XML_PARSE_NONET | XML_PARSE_IGNORE_ENC | XML_PARSE_NOENT | huge);
    xmlParseDocument(context_.get());
    // A failure of the input is the cause; the parser's own complaint about a document that is cut off follows from it.
    if (input_.failed() && !thrown_) {
        Error cause = input_.error();
        if (cause.domain == kXMLErrorDomain)
            addPosition(cause, position());
        error_ = std::move(cause);
    } else if (context_->wellFormed == 0) {
        handle([&] { fail(XML_ERR_DOCUMENT_EMPTY, "it is not well-formed"); });
    }
    if (thrown_)
        std::rethrow_exception(thrown_);
    if (error_) {
        if (error != nullptr)
            *error = *error_;
        return false;
    }
    handler_.endDocument();
    return true;
}

XMLPosition XMLParser::Implementation::position() const
{
    if (context_ == nullptr || context_->input == nullptr)
        return {};
    return {static_cast<std::uint32_t>(context_->input->line), static_cast<std::uint32_t>(context_->input->col)};
}

XMLPosition XMLParser::Implementation::elementPosition() const
{
    XMLPosition found = position();
    if (found.line == 0)
        return found;
    // The parser stands behind the attributes, which cannot contain '<'.
    const std::string_view behind = viewOf(context_->input->base, context_->input->cur);
    const std::size_t begin = behind.rfind('<');
    if (begin == behind.npos)
        return {};
    const std::string_view tag = behind.substr(begin);
    const auto breaks = static_cast<std::uint32_t>(std::count(tag.begin(), tag.end(), '\n'));
    const auto characters = [](std::string_view text) {
        return static_cast<std::uint32_t>(
            std::count_if(text.begin(), text.end(), [](char c) { return (c & 0xC0) != 0x80; }));
    };
    found.line -= breaks;
    if (breaks == 0) {
        found.column -= std::min(characters(tag), found.column - 1);
    } else {
        // The start of the line may no longer be in the parser's buffer.
        const std::size_t lineBreak = behind.rfind('\n', begin);
        const bool isThere = lineBreak != behind.npos || context_->input->consumed == 0;
        found.column =
            isThere ? characters(behind.substr(0, begin).substr(lineBreak == behind.npos ? 0 : lineBreak + 1)) + 1 : 0;
    }
    return found;
}

XMLParser::XMLParser(InputStream& stream, XMLHandler& handler)
    : implementation_(std::make_unique<Implementation>(stream, handler))
{
}

XMLParser::~XMLParser() = default;

void XMLParser::setProgressHandler(ProgressHandler handler)
{
    implementation_->input().setProgressHandler(std::move(handler));
}

bool XMLParser::parse(Error* error)
{
    return implementation_->parse(error);
}

void XMLParser::abort()
{
    implementation_->abort();
}

void XMLParser::setMaximumDepth(int depth)
{
    implementation_->setMaximumDepth(depth);
}

XMLPosition XMLParser::position() const
{
    return implementation_->position();
}

XMLPosition XMLParser::elementPosition() const
{
    return implementation_->elementPosition();
}

} // namespace platform
