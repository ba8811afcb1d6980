// Builds the value of an XML property list from the parser's events, and checks which element may stand where and what
// its text means.
#pragma once

#include "platform/PropertyList.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace platform::plist {

/// Takes the events of a well-formed document in order. The first `false` ends the work; `problem()` says why.
class Builder {
public:
    explicit Builder(PropertyListReading reading) : isLenient_(reading == PropertyListReading::lenient) {}

    bool startElement(std::string_view name);
    bool endElement();
    bool characters(std::string_view text);

    /// The value, once the outermost element has ended.
    Value takeValue() { return std::move(result_); }
    const std::string& problem() const { return problem_; }

private:
    enum class Element : std::uint8_t { none, plist, array, dict, key, string, data, date, yes, no, real, integer };
    struct Container {
        Element element = Element::none;
        Array array;
        Dictionary dictionary;
        std::string key;
        bool hasKey = false; // a key waits for its value
    };

    bool fail(std::string_view problem); // always false
    static Element elementNamed(std::string_view name);
    bool mayStart(Element element, std::string_view name);
    bool endContainer();
    bool endLeaf();
    bool leafValue(Value& value);
    void add(Value value);

    const bool isLenient_;
    std::vector<Container> containers_;
    Element leaf_ = Element::none; // the open element without children
    std::string text_;             // of the leaf
    bool isOpen_ = false;          // inside the plist element
    bool hasResult_ = false;
    Value result_;
    std::string problem_;
};

} // namespace platform::plist
