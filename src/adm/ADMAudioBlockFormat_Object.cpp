#include "adm/ADMAudioBlockFormat_Object.h"

#include "adm/ADMException.h"
#include "adm/ADMNames.h"
#include "adm/ADMText.h"

using platform::XMLAttributes;

ADMAudioBlockFormat_Object::~ADMAudioBlockFormat_Object() = default;

void ADMAudioBlockFormat_Object::setSubElement(std::string_view name, std::string_view value,
                                               const XMLAttributes& attributes)
{
    const auto measure = [value](float& number, bool& isThere) {
        isThere = true;
        number = adm::floatOf(value);
    };
    if (adm::is(name, "position")) {
        addSubElement_position(value, attributes);
    } else if (adm::is(name, "cartesian")) {
        position_.cartesian = adm::booleanOf(value);
    } else if (adm::is(name, "height")) {
        measure(height_, hasHeight_);
    } else if (adm::is(name, "width")) {
        measure(width_, hasWidth_);
    } else if (adm::is(name, "depth")) {
        measure(depth_, hasDepth_);
    } else if (adm::is(name, "jumpPosition")) {
        jumpPosition_ = adm::booleanOf(value);
        const auto length = adm::attribute(attributes, "interpolationLength");
        interpolationLength_ = length ? adm::floatOf(*length) : -1;
    } else if (adm::is(name, "diffuse")) {
        diffuse_ = adm::floatOf(value);
    } else if (adm::is(name, "screenRef")) {
        screenRef_ = adm::booleanOf(value);
    } else {
        ADMAudioBlockFormat::setSubElement(name, value, attributes);
    }
}

void ADMAudioBlockFormat_Object::addSubElement_position(std::string_view value, const XMLAttributes& attributes)
{
    // Kept: the text speaks of cartesian positions for polar ones too.
    const auto coordinate = adm::attribute(attributes, "coordinate");
    if (!coordinate)
        throw ADMException(kADMExceptionMalformedDefinition,
                           "cartesian audioBlockFormat position is missing coordinate attribute");
    if (attributes.find("bound"))
        return; // the distance that a position may be moved is not modelled
    const auto measure = [value](float& number, bool& isThere) {
        isThere = true;
        number = adm::floatOf(value);
    };
    if (adm::is(*coordinate, "azimuth"))
        measure(position_.azimuth, hasPolarAzimuth_);
    else if (adm::is(*coordinate, "elevation"))
        measure(position_.elevation, hasPolarElevation_);
    else if (adm::is(*coordinate, "distance"))
        measure(position_.distance, hasPolarDistance_);
    else if (adm::is(*coordinate, "X"))
        measure(position_.X, hasCartesianX_);
    else if (adm::is(*coordinate, "Y"))
        measure(position_.Y, hasCartesianY_);
    else if (adm::is(*coordinate, "Z"))
        measure(position_.Z, hasCartesianZ_);
}

void ADMAudioBlockFormat_Object::validate() const
{
    const bool isComplete =
        position_.cartesian ? hasCartesianX_ && hasCartesianY_ : hasPolarAzimuth_ && hasPolarElevation_;
    if (!isComplete)
        throw ADMException(kADMExceptionMalformedDefinition,
                           "audioBlockFormat '" + audioBlockFormatID() +
                               (position_.cartesian ? "' is missing X and/or Y cartesian coordinate"
                                                    : "' is missing azimuth and/or elevation polar coordinate"));
}

std::string ADMAudioBlockFormat_Object::description() const
{
    // Kept: the blank ahead of the closing bracket.
    return "<ADMAudioBlockFormat_Object: " + commonDescription() + ", position = " + position_.description() +
           ", size=(width=" + adm::fixedText(width_) + ", depth=" + adm::fixedText(depth_) +
           ", height=" + adm::fixedText(height_) + "), diffuse = " + adm::fixedText(diffuse_) +
           ", jumpPosition = " + adm::booleanText(jumpPosition_) +
           ", interpolationLength = " + adm::fixedText(interpolationLength_) + " >";
}
