// Which sub-elements a class knows: a table from names to the methods that take them.
#pragma once

#include "platform/XMLParser.h"

#include <cstddef>
#include <string_view>

namespace adm {

template <class Element>
struct SubElement {
    std::string_view name;
    void (Element::*add)(std::string_view value, const platform::XMLAttributes& attributes);
};

/// Gives the sub-element to the method of its name, if there is one.
template <class Element, std::size_t Count>
void addSubElement(Element& element, const SubElement<Element> (&table)[Count], std::string_view name,
                   std::string_view value, const platform::XMLAttributes& attributes)
{
    for (const SubElement<Element>& row : table)
        if (row.name == name)
            return (element.*row.add)(value, attributes);
}

} // namespace adm
