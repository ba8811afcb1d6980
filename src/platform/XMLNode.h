// A parsed XML tree, for who would rather look around in a document than listen to it.
#pragma once

#include "platform/XMLParser.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

/// An element of a tree that somebody else owns; valid as long as the tree. Names are as they are written, with their
/// prefixes.
class KT_EXPORT XMLNode {
public:
    /// An element node of the parser library (libxml2's `xmlNodePtr`), of a tree that the caller holds.
    static XMLNode fromLibraryNode(void* node) { return XMLNode(node); }

    std::string name() const;
    /// Null when there is no such attribute.
    std::optional<std::string> attribute(std::string_view name) const;
    /// The child elements of that name, in document order.
    std::vector<XMLNode> elementsForName(std::string_view name) const;
    /// All text within, that of inner elements included.
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

    XMLNode root() const;

private:
    class Builder;
    XMLTree();
    void* document_;
};

} // namespace platform
