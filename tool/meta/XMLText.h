// Edits an XML document as text: everything that is not named stays as it is, to the byte.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

/// Position of an element in a document's text.
struct XMLElement {
    struct Attribute {
        std::string_view name;
        std::size_t begin = 0, end = 0; // of its value, between the quotes
    };

    std::string_view name;
    std::size_t begin = 0;      // start of the opening tag
    std::size_t content = 0;    // end of the opening tag
    std::size_t contentEnd = 0; // start of the closing tag
    std::size_t end = 0;        // its end; equals `content` for an empty-element tag
    std::vector<Attribute> attributes;
    std::vector<XMLElement> children;

    bool isOneTag() const { return content == end; }
    /// In document order.
    std::vector<const XMLElement*> named(std::string_view child) const;
};

class XMLText {
public:
    /// Throws Failure if the document is not well-formed, has a DOCTYPE, or its encoding is no superset of ASCII.
    explicit XMLText(std::string document);

    const std::string& text() const { return text_; }
    /// Its names refer to the text and are valid until that changes.
    const XMLElement& root() const { return root_; }

    // Each parses the document again; elements are those from before.

    /// Replaces the element's whole content.
    void setContent(const XMLElement& element, std::string_view value);
    void setAttribute(const XMLElement& element, std::string_view name, std::string_view value);
    /// Adds a child after the last one, with the same indentation.
    void addChild(const XMLElement& parent, std::string_view name);
    void remove(const XMLElement& element);
    void removeAttribute(const XMLElement& element, std::string_view name);

private:
    void requireWritable(std::string_view name) const;
    void change(std::size_t begin, std::size_t end, std::string_view by);
    void scan();
    std::string escaped(std::string_view value, bool isAttribute) const;

    std::string text_;
    XMLElement root_;
    bool takesUTF8_ = true; // otherwise non-ASCII characters become references
};

/// Whether the text can name an element or attribute.
bool isXMLName(std::string_view name);
