// Streaming XML: a stream is read in pieces, and a handler hears of its elements one by one. Names are taken as
// written: `prefix:name` is a name of its own, `xmlns` an attribute like any other. Only the predefined entities are
// known, and nothing external is opened.
#pragma once

#include "platform/InputStream.h"
#include "platform/core/Error.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace platform {

/// The domain of the errors of XML; their codes are the parser library's own.
inline constexpr const char* kXMLErrorDomain = "xml";
/// How many elements may be open at a time.
inline constexpr int kXMLMaximumDepth = 256;

/// One attribute of an element; both are views.
struct XMLAttribute {
    std::string_view name;  // as written, with its prefix
    std::string_view value; // with entities resolved
};

/// The attributes of one element, as written and in that order; a view, valid as long as what it looks at.
class XMLAttributes {
public:
    XMLAttributes() = default;
    /// Looks at `attributes`.
    XMLAttributes(const std::vector<XMLAttribute>& attributes) : attributes_(attributes) {}
    /// For one call: `f({{"name", "value"}})`.
    XMLAttributes(std::initializer_list<XMLAttribute> attributes) : attributes_(attributes.begin(), attributes.size())
    {
    }

    /// The value of an attribute; null when there is none.
    std::optional<std::string_view> find(std::string_view name) const
    {
        for (const XMLAttribute& attribute : attributes_)
            if (attribute.name == name)
                return attribute.value;
        return std::nullopt;
    }
    auto begin() const { return attributes_.begin(); }
    auto end() const { return attributes_.end(); }
    std::size_t size() const { return attributes_.size(); }

private:
    std::span<const XMLAttribute> attributes_;
};

/// A place in a document, both counted from 1, columns in characters; 0 where unknown.
struct XMLPosition {
    std::uint32_t line = 0;   // from 1; 0 where unknown
    std::uint32_t column = 0; // from 1, in characters; 0 where unknown
    friend bool operator==(const XMLPosition&, const XMLPosition&) = default;
};

/// Hears of a document. The texts are valid during the call. An exception of a handler ends the parse and passes
/// through it.
class KT_EXPORT XMLHandler {
public:
    virtual ~XMLHandler() = default;
    /// Called for a start tag, and for an empty element ahead of its end.
    virtual void startElement(std::string_view name, const XMLAttributes& attributes) = 0;
    /// Called for an end tag, and for an empty element.
    virtual void endElement(std::string_view name) = 0;
    /// Text, CDATA and white space alike; one text may come in many pieces.
    virtual void characters(std::string_view text) = 0;
    /// Called at the end of a well-formed document only.
    virtual void endDocument() {}
};

/// One parse of one stream, in UTF-8, UTF-16, US-ASCII or ISO-8859-1. Refused, besides what is not well-formed:
/// declarations inside a DOCTYPE (and so every entity of a document's own), tags of more than 16 KiB, a depth of more
/// than `kXMLMaximumDepth`, comments and CDATA sections of more than 10 MB, as much white space around the root
/// element, more than 256 namespaces in force at a time, more than 10,000 different names. Memory does not grow with
/// the document.
class KT_EXPORT XMLParser {
public:
    /// Takes the number of bytes read so far and returns false to cancel.
    using ProgressHandler = std::function<bool(std::uint64_t)>;

    /// Stream and handler must outlive the parser.
    XMLParser(InputStream& stream, XMLHandler& handler);
    ~XMLParser();
    XMLParser(const XMLParser&) = delete;
    XMLParser& operator=(const XMLParser&) = delete;

    /// Called for each piece that is read, of 64 KiB at most; empty means none.
    void setProgressHandler(ProgressHandler handler);
    /// How many elements may be open at a time, instead of `kXMLMaximumDepth`. A greater depth also lifts the limit
    /// of comments and CDATA sections, since the parser library has one limit for both.
    void setMaximumDepth(int depth);

    /// True for a well-formed document. Otherwise false with `error`: of the domain `kXMLErrorDomain` with "line" and
    /// "column" in its user information, or of `ErrorDomain::status` with the stream's code or kStatusUserCancelled.
    /// What the handlers throw passes through.
    bool parse(Error* error = nullptr);
    /// Ends the parse from within a handler: no further event, and parse() returns false, cancelled.
    void abort();

    /// The place that the parser has reached.
    XMLPosition position() const;
    /// The place where the element's tag begins; only within `startElement`.
    XMLPosition elementPosition() const;

private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace platform
