// A parsed XML tree, for clients that look around in a document instead of hearing its events.
#pragma once

#include "platform/XMLParser.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

/// An element of a tree that somebody else owns; valid as long as the tree. Names are as written, with their
/// prefixes.
class KT_EXPORT XMLNode {
public:
    /// An element node of the parser library (libxml2's `xmlNodePtr`), of a tree that the caller holds.
    static XMLNode fromLibraryNode(void* node) { return XMLNode(node); }

    /// The name of the element.
    std::string name() const;
    /// The value of an attribute; null when there is no such attribute.
    std::optional<std::string> attribute(std::string_view name) const;
    /// The child elements of that name, in document order.
    std::vector<XMLNode> elementsForName(std::string_view name) const;
    /// All text within, including that of inner elements.
    std::string stringValue() const;

private:
    explicit XMLNode(void* node) : node_(node) {}
    void* node_;
};

/// A tree and its memory, read under the rules of XMLParser.
class KT_EXPORT XMLTree {
public:
    /// Null, with `error`, when the document is not well-formed.
    static std::unique_ptr<XMLTree> parse(InputStream& stream, Error* error = nullptr);
    ~XMLTree();
    XMLTree(const XMLTree&) = delete;
    XMLTree& operator=(const XMLTree&) = delete;

    /// The outermost element.
    XMLNode root() const;

private:
    class Builder;
    XMLTree();
    void* document_;
};

} // namespace platform
