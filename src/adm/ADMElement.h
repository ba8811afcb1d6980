// Base of all elements of an ADM document (ITU-R BS.2076). An element is made from its attributes, is told its
// sub-elements one by one, and turns its references into links when the document is complete.
#pragma once

#include "platform/XMLParser.h"
#include "platform/core/Export.h"

#include <optional>
#include <string>
#include <string_view>

class ADMElement;

/// Finds the element that an ID names.
class KT_EXPORT ADMElementResolver {
public:
    virtual ~ADMElementResolver();
    /// `findADMElementRef:typePrefix:`. Null for no ID. Without a prefix, the prefix of the ID counts. May raise
    /// MissingDefinition.
    virtual ADMElement* findADMElementRef(std::optional<std::string_view> identifier,
                                          std::optional<std::string_view> typePrefix = {}) = 0;
    /// Whether a look-up by prefix always finds the class that the prefix names, so that callers need not check it.
    virtual bool findsClassesOfPrefixes() const { return false; }
    /// Announces an ID that is looked up soon, so that its memory can be fetched ahead. Does nothing by default.
    virtual void expectADMElementRef(std::string_view identifier, std::string_view typePrefix);
};

/// One element. Links between elements are non-owning: the document owns them all, and links are valid as long as it
/// lives.
class KT_EXPORT ADMElement {
public:
    virtual ~ADMElement();
    ADMElement(const ADMElement&) = delete;
    ADMElement& operator=(const ADMElement&) = delete;

    /// The name of the element in a document, such as "audioObject".
    virtual std::string_view elementName() const = 0;
    /// The element's own ID, whatever its class calls it.
    virtual std::string elementID() const = 0;

    /// `setSubElement:value:attributes:`. A name that the class does not know is ignored; values are not trimmed.
    virtual void setSubElement(std::string_view name, std::string_view value,
                               const platform::XMLAttributes& attributes);
    /// `resolveIDRefsWithResolver:`. Call it once: a second call appends the same links again. Raises what the
    /// resolver raises.
    virtual void resolveIDRefsWithResolver(ADMElementResolver& resolver);
    /// Announces to the resolver some of the IDs that resolving begins with.
    virtual void announceIDRefsToResolver(ADMElementResolver& resolver) const;
    /// Reads the timestamps among the attributes a second time, as decimals, for the accessors that begin with
    /// "exact".
    virtual void readExactTimes(const platform::XMLAttributes& attributes);
    /// A text for debugging; its form is not fixed.
    virtual std::string description() const;

    /// Where the element begins in its document; zeros for one that was not parsed, and for blocks.
    platform::XMLPosition documentPosition() const { return documentPosition_; }
    void setDocumentPosition(platform::XMLPosition position) { documentPosition_ = position; }

protected:
    ADMElement() = default;

private:
    platform::XMLPosition documentPosition_;
};
