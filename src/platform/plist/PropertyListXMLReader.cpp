#include "platform/String.h"
#include "platform/core/Packed.h"
#include "platform/plist/PropertyListBuilder.h"
#include "platform/plist/PropertyListXML.h"

#include <algorithm>
#include <exception>
#include <memory>

#include <libxml/parser.h>
#include <libxml/parserInternals.h>

namespace platform::plist {

namespace {

// The parser compares every attribute of a tag with every other, and property lists have one at most: so that time
// stays in proportion to the bytes, a tag for which more than this is read is refused.
constexpr std::size_t kLongestTag = 16 * 1024;

/// One parse: libxml2 takes the bytes piece by piece, and its events go to a Builder. Nothing is thrown through the C
/// library's frames.
class Parse {
public:
    bool run(std::string_view utf8, Value& value, std::string& problem);

private:
    static xmlSAXHandler handlers();

    template <class Event>
    static void handle(void* context, Event event)
    {
        auto& parse = *static_cast<Parse*>(context);
        parse.sinceEvent_ = 0;
        if (parse.failed_)
            return;
        try {
            parse.failed_ = !event(parse.builder_);
        } catch (...) {
            parse.failed_ = true;
            parse.thrown_ = std::current_exception();
        }
        if (parse.failed_)
            parse.line_ = xmlSAX2GetLineNumber(parse.context_.get());
    }
    static void onCharacters(void* context, const xmlChar* text, int length)
    {
        handle(context, [=](Builder& builder) {
            return builder.characters({reinterpret_cast<const char*>(text), static_cast<std::size_t>(length)});
        });
    }
    static void refuseDeclaration(void* context)
    {
        handle(context, [](Builder& builder) { return builder.fail("a declaration inside the DOCTYPE"); });
    }
    static void onError(void* context, xmlErrorPtr error);
    static int onRead(void* context, char* buffer, int length);
    bool isWithinTag() const;

    struct FreeContext {
        void operator()(xmlParserCtxtPtr context) const
        {
            if (context->myDoc != nullptr)
                xmlFreeDoc(context->myDoc);
            xmlFreeParserCtxt(context);
        }
    };

    BytesView bytes_;            // not read yet
    std::size_t sinceEvent_ = 0; // bytes read since the last event
    Builder builder_;
    bool failed_ = false;
    int line_ = 0;
    std::exception_ptr thrown_;
    std::unique_ptr<xmlParserCtxt, FreeContext> context_;
};

xmlSAXHandler Parse::handlers()
{
    xmlSAXHandler sax{};
    sax.initialized = XML_SAX2_MAGIC; // without it the process-wide error handlers would be called
    sax.startElementNs = [](void* context, const xmlChar* name, const xmlChar* prefix, const xmlChar*, int,
                            const xmlChar**, int, int, const xmlChar**) {
        handle(context, [=](Builder& b) {
            if (prefix != nullptr)
                return b.fail("an element with a prefix");
            return b.startElement(reinterpret_cast<const char*>(name));
        });
    };
    sax.endElementNs = [](void* context, const xmlChar*, const xmlChar*, const xmlChar*) {
        handle(context, [](Builder& b) { return b.endElement(); });
    };
    sax.characters = sax.ignorableWhitespace = sax.cdataBlock = onCharacters;
    sax.comment = [](void* context, const xmlChar*) { handle(context, [](Builder&) { return true; }); };
    sax.processingInstruction = [](void* context, const xmlChar*, const xmlChar*) {
        handle(context, [](Builder&) { return true; });
    };
    sax.entityDecl = [](void* c, const xmlChar*, int, const xmlChar*, const xmlChar*, xmlChar*) {
        refuseDeclaration(c);
    };
    sax.unparsedEntityDecl = [](void* c, const xmlChar*, const xmlChar*, const xmlChar*, const xmlChar*) {
        refuseDeclaration(c);
    };
    sax.notationDecl = [](void* c, const xmlChar*, const xmlChar*, const xmlChar*) { refuseDeclaration(c); };
    sax.elementDecl = [](void* c, const xmlChar*, int, xmlElementContentPtr) { refuseDeclaration(c); };
    sax.attributeDecl = [](void* c, const xmlChar*, const xmlChar*, int, int, const xmlChar*,
                           xmlEnumerationPtr values) {
        xmlFreeEnumeration(values); // the handler owns it
        refuseDeclaration(c);
    };
    sax.serror = onError;
    return sax;
}

void Parse::onError(void* context, xmlErrorPtr error)
{
    // An unknown entity is only a recoverable error when the DOCTYPE names a DTD, which might declare it: refused too,
    // like every other.
    if (error->level == XML_ERR_WARNING)
        return;
    handle(context, [&](Builder& builder) {
        std::string_view message = error->message == nullptr ? "" : error->message;
        while (message.ends_with('\n'))
            message.remove_suffix(1);
        // The message quotes the file, which may have names of any length.
        return builder.fail(message.empty() || message.size() > 200 ? "it is not well-formed" : message);
    });
}

int Parse::onRead(void* context, char* buffer, int length)
{
    auto& parse = *static_cast<Parse*>(context);
    if (!parse.isWithinTag())
        parse.sinceEvent_ = 0;
    else if (parse.sinceEvent_ > kLongestTag)
        handle(context, [](Builder& builder) { return builder.fail("a tag is too long"); });
    // The file ends here for the parser, which may not be stopped by force while it holds pointers into its buffer.
    if (parse.failed_)
        return 0;
    const BytesView piece = parse.bytes_.first(std::min(static_cast<std::size_t>(length), parse.bytes_.size()));
    std::copy(piece.begin(), piece.end(), reinterpret_cast<std::byte*>(buffer));
    parse.bytes_ = parse.bytes_.subspan(piece.size());
    parse.sinceEvent_ += piece.size();
    return static_cast<int>(piece.size());
}

/// Whether what is being parsed is a tag, when there was no event for long: text comes in small pieces, while comments,
/// CDATA sections and the DOCTYPE, which come whole, have states of their own.
bool Parse::isWithinTag() const
{
    return context_->instate == XML_PARSER_CONTENT || context_->instate == XML_PARSER_ATTRIBUTE_VALUE;
}

bool Parse::run(std::string_view utf8, Value& value, std::string& problem)
{
    xmlInitParser();
    bytes_ = bytesOf(utf8);
    xmlSAXHandler sax = handlers();
    context_.reset(xmlCreateIOParserCtxt(&sax, this, onRead, nullptr, this, XML_CHAR_ENCODING_NONE));
    if (context_ == nullptr)
        throw std::bad_alloc();
    // XML_PARSE_HUGE lifts the parser's own limits (depth 256, texts of 10 MB): the Builder has its own.
    xmlCtxtUseOptions(context_.get(), XML_PARSE_NONET | XML_PARSE_HUGE | XML_PARSE_IGNORE_ENC);
    xmlParseDocument(context_.get());
    if (context_->wellFormed == 0)
        handle(this, [](Builder& builder) { return builder.fail("it is not well-formed"); });
    if (thrown_)
        std::rethrow_exception(thrown_);
    if (failed_) {
        problem = "line " + std::to_string(line_) + ": " + builder_.problem();
        return false;
    }
    value = builder_.takeValue();
    return true;
}

/// The text in UTF-8, without its byte order mark; null when it is neither UTF-8 nor UTF-16 with a mark. The parser's
/// own decoders are not used: they report bad bytes to the process-wide error handlers.
String decoded(BytesView bytes)
{
    std::string_view text = textOf(bytes);
    const bool isBig = text.starts_with("\xFE\xFF");
    if (!isBig && !text.starts_with("\xFF\xFE")) {
        if (text.starts_with("\xEF\xBB\xBF"))
            text.remove_prefix(3);
        return String::fromUTF8(text);
    }
    if (bytes.size() % 2 != 0)
        return {};
    std::u16string units(bytes.size() / 2 - 1, u'\0');
    for (std::size_t i = 0; i < units.size(); ++i)
        units[i] = load<char16_t>(bytes.data() + 2 + i * 2, isBig ? std::endian::big : std::endian::little);
    return String::fromUTF16(units);
}

} // namespace

bool readXML(BytesView bytes, Value& value, std::string& problem)
{
    const String text = decoded(bytes);
    // A NUL is no character of XML, and near the start it would make the parser guess another encoding.
    if (text.isNull() || text.utf8().find('\0') != std::string::npos) {
        problem = "the text is neither UTF-8 nor UTF-16";
        return false;
    }
    return Parse().run(text.utf8(), value, problem);
}

} // namespace platform::plist
