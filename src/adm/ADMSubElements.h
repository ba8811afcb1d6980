// The sub-elements that a class knows: a table from names to the methods that take them.
#pragma once

#include "platform/XMLParser.h"

#include <cstddef>
#include <string_view>

namespace adm {

/// A row of such a table.
template <class Element>
struct SubElement {
    std::string_view name; // as in a document
    /// the method that takes its text and its attributes
    void (Element::*add)(std::string_view value, const platform::XMLAttributes& attributes);
};

/// Calls the method of that name, if there is one.
template <class Element, std::size_t Count>
void addSubElement(Element& element, const SubElement<Element> (&table)[Count], std::string_view name,
                   std::string_view value, const platform::XMLAttributes& attributes)
{
    for (const SubElement<Element>& row : table)
        if (row.name == name)
            return (element.*row.add)(value, attributes);
}

} // namespace adm
