// A sub-element that is no ADM element of its own: its name, its text, its attributes.
#pragma once

#include "platform/XMLParser.h"
#include "platform/core/Export.h"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

/// A sub-element while it is parsed: its name, its text and its attributes, all of which it owns.
class KT_EXPORT ADMGenericElement {
public:
    /// `elementWithName:attributes:`; the value is empty.
    static std::unique_ptr<ADMGenericElement> elementWithName(std::string_view name,
                                                              const platform::XMLAttributes& attributes);
    ADMGenericElement(const ADMGenericElement&) = delete;
    ADMGenericElement& operator=(const ADMGenericElement&) = delete;

    /// The name as written, with its prefix.
    const std::string& name() const { return name_; }
    void setName(std::string name) { name_ = std::move(name); }
    /// The text so far, untrimmed.
    const std::string& value() const { return value_; }
    void setValue(std::string value) { value_ = std::move(value); }
    /// Appends a piece of text to value().
    void appendValue(std::string_view text) { value_ += text; }
    /// The attributes in document order: views of what the element owns.
    platform::XMLAttributes attributes() const { return attributes_; }
    /// Copies the attributes, which must not be views of this element's own.
    void setAttributes(const platform::XMLAttributes& attributes);

    /// Where the element begins, when a handler for problems is set; else zeros.
    platform::XMLPosition documentPosition() const { return documentPosition_; }
    void setDocumentPosition(platform::XMLPosition position) { documentPosition_ = position; }

    /// Makes it another element, whose value is empty, and keeps the memory.
    void reset(std::string_view name, const platform::XMLAttributes& attributes);

private:
    ADMGenericElement() = default;

    std::string name_;
    std::string value_;
    std::vector<char> text_; // the text of the attributes, with spare room after it
    std::vector<platform::XMLAttribute> attributes_;
    platform::XMLPosition documentPosition_;
};
