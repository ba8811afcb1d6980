#include "adm/ADMGenericElement.h"

#include <algorithm>

std::unique_ptr<ADMGenericElement> ADMGenericElement::elementWithName(std::string_view name,
                                                                      const platform::XMLAttributes& attributes)
{
    std::unique_ptr<ADMGenericElement> element(new ADMGenericElement);
    element->reset(name, attributes);
    return element;
}

void ADMGenericElement::reset(std::string_view name, const platform::XMLAttributes& attributes)
{
    name_ = name;
    value_.clear();
    if (attributes.size() != 0 || !attributes_.empty())
        setAttributes(attributes);
}

void ADMGenericElement::setAttributes(const platform::XMLAttributes& attributes)
{
    std::size_t size = 0;
    for (const auto& [name, value] : attributes)
        size += name.size() + value.size();
    if (text_.size() < size)
        text_.resize(size);
    attributes_.clear();
    char* at = text_.data();
    const auto keep = [&at](std::string_view part) {
        const std::string_view kept(at, part.size());
        at = std::copy(part.begin(), part.end(), at);
        return kept;
    };
    for (const auto& [name, value] : attributes) {
        const std::string_view keptName = keep(name);
        attributes_.push_back({keptName, keep(value)});
    }
}
