// An XML document edited as text: what is not named stays as it is, to the byte.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

/// Where one element stands in the text of a document.
struct XMLElement {
    struct Attribute {
        std::string_view name;
        std::size_t begin = 0, end = 0; // of its value, between the quotes
    };

    std::string_view name;
    std::size_t begin = 0;      // of the tag that opens it
    std::size_t content = 0;    // behind that tag
    std::size_t contentEnd = 0; // where the tag that closes it begins
    std::size_t end = 0;        // behind that; as `content` of a tag that is both
    std::vector<Attribute> attributes;
    std::vector<XMLElement> children;

    bool isOneTag() const { return content == end; }
    /// In the order of the document.
    std::vector<const XMLElement*> named(std::string_view child) const;
};

class XMLText {
public:
    /// Throws Failure for what is not well-formed, has a DOCTYPE, or is in an encoding that is no superset of ASCII.
    explicit XMLText(std::string document);

    const std::string& text() const { return text_; }
    /// Its names look at the text, until that is changed.
    const XMLElement& root() const { return root_; }

    // Each reads the document anew; elements are those of the document as it was.

    /// In the place of all that the element holds.
    void setContent(const XMLElement& element, std::string_view value);
    void setAttribute(const XMLElement& element, std::string_view name, std::string_view value);
    /// Behind the last child, set off as that is.
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
    bool takesUTF8_ = true; // else what is not ASCII becomes references
};

/// Whether it can name an element or an attribute.
bool isXMLName(std::string_view name);
