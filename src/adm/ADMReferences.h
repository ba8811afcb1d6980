// References from one element to others: the IDs as they stand in the document, and the links found for them.
#pragma once

#include "adm/ADMElement.h"

#include <algorithm>
#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace adm {

/// So many look-ups ahead of one it is told what will be looked for: each waits for memory otherwise.
inline constexpr std::size_t kAnnounced = 8;

/// What a resolver found for the prefix of this class. A cast that asks the element would wait for its memory.
template <class Element>
Element* elementAs(ADMElement* found, const ADMElementResolver& resolver)
{
    return resolver.findsClassesOfPrefixes() ? static_cast<Element*>(found) : dynamic_cast<Element*>(found);
}

} // namespace adm

/// Any number of them, in the order of the document.
template <class Element>
struct ADMReferenceList {
    std::vector<std::string> ids;
    std::vector<Element*> elements; // null where an ID was let pass that names nothing

    void resolve(ADMElementResolver& resolver, std::string_view prefix)
    {
        elements.reserve(elements.size() + ids.size());
        for (std::size_t i = 0; i < ids.size(); ++i) {
            if (i + adm::kAnnounced < ids.size())
                resolver.expectADMElementRef(ids[i + adm::kAnnounced], prefix);
            elements.push_back(adm::elementAs<Element>(resolver.findADMElementRef(ids[i], prefix), resolver));
        }
    }
    /// What resolve() does not tell of itself.
    void announce(ADMElementResolver& resolver, std::string_view prefix) const
    {
        for (std::size_t i = 0; i < std::min(adm::kAnnounced, ids.size()); ++i)
            resolver.expectADMElementRef(ids[i], prefix);
    }
};

/// At most one.
template <class Element>
struct ADMReference {
    std::optional<std::string> id;
    Element* element = nullptr;

    void resolve(ADMElementResolver& resolver, std::string_view prefix)
    {
        element = adm::elementAs<Element>(resolver.findADMElementRef(id, prefix), resolver);
    }
    void announce(ADMElementResolver& resolver, std::string_view prefix) const
    {
        if (id)
            resolver.expectADMElementRef(*id, prefix);
    }
};

namespace adm {

/// "(AC_00031001, AC_00031002)": links by their IDs, as elements may link each other in circles.
template <class Element>
std::string linksText(const std::vector<Element*>& elements)
{
    std::string text = "(";
    for (const Element* element : elements) {
        if (text.size() > 1)
            text += ", ";
        text += element == nullptr ? "(null)" : element->elementID();
    }
    return text += ")";
}

template <class Element>
std::string linkText(const Element* element)
{
    return element == nullptr ? "(null)" : element->elementID();
}

} // namespace adm
