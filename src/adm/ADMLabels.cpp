#include "adm/ADMLabels.h"

#include "adm/ADMAttributes.h"

void adm::addLabel(ADMLabels& labels, std::string_view value, const platform::XMLAttributes& attributes)
{
    if (const auto language = ADMGetAttribute(attributes, "language"))
        labels[std::string(*language)] = value;
}
