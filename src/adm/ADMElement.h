// What all elements of an ADM document (ITU-R BS.2076) share: they are made from their attributes, hear of their
// sub-elements one by one, and turn their references into links when the document is complete.
#pragma once

#include "platform/XMLParser.h"
#include "platform/core/Export.h"

#include <optional>
#include <string>
#include <string_view>

class ADMElement;

/// Finds what an ID names.
class KT_EXPORT ADMElementResolver {
public:
    virtual ~ADMElementResolver();
    /// `findADMElementRef:typePrefix:`. Null for no ID. Without a prefix that of the ID is taken. May raise
    /// MissingDefinition.
    virtual ADMElement* findADMElementRef(std::optional<std::string_view> identifier,
                                          std::optional<std::string_view> typePrefix = {}) = 0;
    /// Whether what it finds for a prefix is always of the class that the prefix names, so that nobody need ask it.
    virtual bool findsClassesOfPrefixes() const { return false; }
    /// That the ID will be looked for soon: time to ask memory for what lies where it would be found.
    virtual void expectADMElementRef(std::string_view identifier, std::string_view typePrefix);
};

/// Element links are non-owning: the document owns every element, and links are valid as long as it lives.
class KT_EXPORT ADMElement {
public:
    virtual ~ADMElement();
    ADMElement(const ADMElement&) = delete;
    ADMElement& operator=(const ADMElement&) = delete;

    /// The name of the element in a document.
    virtual std::string_view elementName() const = 0;
    /// The element's own ID, whatever its class calls it.
    virtual std::string elementID() const = 0;

    /// `setSubElement:value:attributes:`. A name that the class does not know is ignored; values are not trimmed.
    virtual void setSubElement(std::string_view name, std::string_view value,
                               const platform::XMLAttributes& attributes);
    /// `resolveIDRefsWithResolver:`. To be called once: a second call appends the same links again.
    virtual void resolveIDRefsWithResolver(ADMElementResolver& resolver);
    /// Tells the resolver some of the IDs that resolving will begin with.
    virtual void announceIDRefsToResolver(ADMElementResolver& resolver) const;
    /// Reads the timestamps among the attributes a second time, as decimals, for the accessors that begin with "exact".
    virtual void readExactTimes(const platform::XMLAttributes& attributes);
    /// A text for debugging.
    virtual std::string description() const;

    /// Where the element began in its document; zeros for one that was made by hand, and for blocks.
    platform::XMLPosition documentPosition() const { return documentPosition_; }
    void setDocumentPosition(platform::XMLPosition position) { documentPosition_ = position; }

protected:
    ADMElement() = default;

private:
    platform::XMLPosition documentPosition_;
};
