// References from one element to others: the IDs as the document has them, and the links found for them.
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

/// How far ahead an ID is announced before it is looked up; each look-up waits for memory otherwise.
inline constexpr std::size_t kAnnounced = 8;

/// The resolver's result as the class that the prefix names. A cast that asks the element itself would wait for its
/// memory.
template <class Element>
Element* elementAs(ADMElement* found, const ADMElementResolver& resolver)
{
    return resolver.findsClassesOfPrefixes() ? static_cast<Element*>(found) : dynamic_cast<Element*>(found);
}

} // namespace adm

/// Any number of references, in document order.
template <class Element>
struct ADMReferenceList {
    std::vector<std::string> ids;   // as written
    std::vector<Element*> elements; // null where an ID that names nothing was let pass

    /// Appends the elements of all IDs. Raises what the resolver raises.
    void resolve(ADMElementResolver& resolver, std::string_view prefix)
    {
        elements.reserve(elements.size() + ids.size());
        for (std::size_t i = 0; i < ids.size(); ++i) {
            if (i + adm::kAnnounced < ids.size())
                resolver.expectADMElementRef(ids[i + adm::kAnnounced], prefix);
            elements.push_back(adm::elementAs<Element>(resolver.findADMElementRef(ids[i], prefix), resolver));
        }
    }
    /// Announces the first IDs, which resolve() looks up without having announced them.
    void announce(ADMElementResolver& resolver, std::string_view prefix) const
    {
        for (std::size_t i = 0; i < std::min(adm::kAnnounced, ids.size()); ++i)
            resolver.expectADMElementRef(ids[i], prefix);
    }
};

/// At most one reference.
template <class Element>
struct ADMReference {
    std::optional<std::string> id; // null when the document gives none
    Element* element = nullptr;    // null until it is resolved, and for none

    /// Fills in the element. Raises what the resolver raises.
    void resolve(ADMElementResolver& resolver, std::string_view prefix)
    {
        element = adm::elementAs<Element>(resolver.findADMElementRef(id, prefix), resolver);
    }
    /// Announces the ID, if there is one.
    void announce(ADMElementResolver& resolver, std::string_view prefix) const
    {
        if (id)
            resolver.expectADMElementRef(*id, prefix);
    }
};

namespace adm {

/// "(AC_00031001, AC_00031002)": links by their IDs, since elements may link each other in circles.
template <class Element>
std::string linksText(const std::vector<Element*>& elements)
{
    std::string text = "(";
    for (const Element* element : elements) {
        if (text.size() > 1)
            text += ", ";
        text += element == nullptr ? "(null)" : element->elementID();
    }
    /// The ID of a link; "(null)" for none.
    return text += ")";
}

/// The ID of a link; "(null)" for none.
template <class Element>
std::string linkText(const Element* element)
{
    return element == nullptr ? "(null)" : element->elementID();
}

} // namespace adm
