#include "platform/XMLNode.h"

#include <limits>
#include <new>

#include <libxml/tree.h>

namespace platform {

namespace {

std::string_view textViewOf(const xmlChar* text)
{
    return text == nullptr ? std::string_view() : reinterpret_cast<const char*>(text);
}

const xmlChar* xmlText(const std::string& text)
{
    return reinterpret_cast<const xmlChar*>(text.c_str());
}

/// The qualified name of an element or attribute. The library splits it in two if it knows the namespace.
std::string nameOf(const xmlChar* name, const xmlNs* space)
{
    std::string written;
    if (space != nullptr && space->prefix != nullptr)
        (written = textViewOf(space->prefix)) += ':';
    return written += textViewOf(name);
}

/// The text below a library node; entities of the tree itself are replaced.
std::string contentOf(const void* node)
{
    const std::unique_ptr<xmlChar, void (*)(void*)> content(xmlNodeGetContent(static_cast<const xmlNode*>(node)),
                                                            [](void* text) { xmlFree(text); });
    return std::string(textViewOf(content.get()));
}

template <class Node>
Node* orNoMemory(Node* made)
{
    if (made == nullptr)
        throw std::bad_alloc();
    return made;
}

} // namespace

std::string XMLNode::name() const
{
    const auto* node = static_cast<const xmlNode*>(node_);
    return nameOf(node->name, node->ns);
}

std::optional<std::string> XMLNode::attribute(std::string_view name) const
{
    for (const xmlAttr* at = static_cast<const xmlNode*>(node_)->properties; at != nullptr; at = at->next)
        if (nameOf(at->name, at->ns) == name)
            return contentOf(at);
    return std::nullopt;
}

std::vector<XMLNode> XMLNode::elementsForName(std::string_view name) const
{
    std::vector<XMLNode> found;
    for (xmlNode* at = static_cast<const xmlNode*>(node_)->children; at != nullptr; at = at->next)
        if (at->type == XML_ELEMENT_NODE && nameOf(at->name, at->ns) == name)
            found.push_back(XMLNode(at));
    return found;
}

std::string XMLNode::stringValue() const
{
    return contentOf(node_);
}

/// Builds the nodes from the parser's events, so that a tree has the same limits.
class XMLTree::Builder : public XMLHandler {
public:
    explicit Builder(xmlDocPtr document) : document_(document) {}

    void startElement(std::string_view name, const XMLAttributes& attributes) override
    {
        addText();
        xmlNodePtr node = orNoMemory(xmlNewDocNode(document_, nullptr, xmlText(std::string(name)), nullptr));
        if (open_ == nullptr)
            xmlDocSetRootElement(document_, node);
        else
            xmlAddChild(open_, node);
        open_ = node;
        for (const XMLAttribute& attribute : attributes)
            orNoMemory(xmlNewProp(node, xmlText(std::string(attribute.name)), xmlText(std::string(attribute.value))));
    }
    void endElement(std::string_view) override
    {
        addText();
        open_ = open_->parent->type == XML_ELEMENT_NODE ? open_->parent : nullptr;
    }
    void characters(std::string_view text) override
    {
        if (open_ != nullptr)
            text_ += text;
    }

private:
    /// Adds the pieces of a text at once; the library would search for its end at each piece.
    void addText()
    {
        if (text_.empty())
            return;
        if (text_.size() > std::size_t{std::numeric_limits<int>::max()}) // the library counts in int
            throw std::bad_alloc();
        xmlNodeAddContentLen(open_, xmlText(text_), static_cast<int>(text_.size()));
        text_.clear();
    }

    xmlDocPtr document_;
    std::string text_;
    xmlNodePtr open_ = nullptr;
};

XMLTree::XMLTree() : document_(orNoMemory(xmlNewDoc(nullptr)))
{
}

XMLTree::~XMLTree()
{
    xmlFreeDoc(static_cast<xmlDocPtr>(document_));
}

std::unique_ptr<XMLTree> XMLTree::parse(InputStream& stream, Error* error)
{
    std::unique_ptr<XMLTree> tree(new XMLTree);
    Builder builder(static_cast<xmlDocPtr>(tree->document_));
    return XMLParser(stream, builder).parse(error) ? std::move(tree) : nullptr;
}

XMLNode XMLTree::root() const
{
    return XMLNode::fromLibraryNode(xmlDocGetRootElement(static_cast<xmlDocPtr>(document_)));
}

} // namespace platform
