#include "adm/ADMElement.h"

#include "adm/ADMText.h"

ADMElementResolver::~ADMElementResolver() = default;

ADMElement::~ADMElement() = default;

void ADMElement::setSubElement(std::string_view, std::string_view, const platform::XMLAttributes&)
{
}

void ADMElement::resolveIDRefsWithResolver(ADMElementResolver&)
{
}

void ADMElementResolver::expectADMElementRef(std::string_view, std::string_view)
{
}

void ADMElement::announceIDRefsToResolver(ADMElementResolver&) const
{
}

void ADMElement::readExactTimes(const platform::XMLAttributes&)
{
}

std::string ADMElement::description() const
{
    return "<" + std::string(elementName()) + ": " + adm::addressText(this) + ", ID: " + elementID() + ">";
}
