// A block of a channel that sounds from a place: where it is, how far it extends, how it gets there.
#pragma once

#include "adm/ADMAudioBlockFormat.h"

class KT_EXPORT ADMAudioBlockFormat_Object : public ADMAudioBlockFormat {
public:
    explicit ADMAudioBlockFormat_Object(const platform::XMLAttributes& attributes) : ADMAudioBlockFormat(attributes) {}
    /// For the factory, which has read the ID.
    ADMAudioBlockFormat_Object(const Identity& identity, const platform::XMLAttributes& attributes)
        : ADMAudioBlockFormat(identity, attributes)
    {
    }
    ~ADMAudioBlockFormat_Object() override;

    const ADMPosition& position() const { return position_; }
    void setPosition(const ADMPosition& value) { position_ = value; }
    bool hasCartesianX() const { return hasCartesianX_; }
    void setHasCartesianX(bool value) { hasCartesianX_ = value; }
    bool hasCartesianY() const { return hasCartesianY_; }
    void setHasCartesianY(bool value) { hasCartesianY_ = value; }
    bool hasCartesianZ() const { return hasCartesianZ_; }
    void setHasCartesianZ(bool value) { hasCartesianZ_ = value; }
    bool hasPolarAzimuth() const { return hasPolarAzimuth_; }
    void setHasPolarAzimuth(bool value) { hasPolarAzimuth_ = value; }
    bool hasPolarElevation() const { return hasPolarElevation_; }
    void setHasPolarElevation(bool value) { hasPolarElevation_ = value; }
    bool hasPolarDistance() const { return hasPolarDistance_; }
    void setHasPolarDistance(bool value) { hasPolarDistance_ = value; }
    float width() const { return width_; }
    void setWidth(float value) { width_ = value; }
    float height() const { return height_; }
    void setHeight(float value) { height_ = value; }
    float depth() const { return depth_; }
    void setDepth(float value) { depth_ = value; }
    bool hasWidth() const { return hasWidth_; }
    void setHasWidth(bool value) { hasWidth_ = value; }
    bool hasHeight() const { return hasHeight_; }
    void setHasHeight(bool value) { hasHeight_ = value; }
    bool hasDepth() const { return hasDepth_; }
    void setHasDepth(bool value) { hasDepth_ = value; }
    float diffuse() const { return diffuse_; }
    void setDiffuse(float value) { diffuse_ = value; }
    bool jumpPosition() const { return jumpPosition_; }
    void setJumpPosition(bool value) { jumpPosition_ = value; }
    /// In seconds; -1 when "jumpPosition" does not tell, 0 when there is no "jumpPosition".
    float interpolationLength() const { return interpolationLength_; }
    void setInterpolationLength(float value) { interpolationLength_ = value; }
    bool screenRef() const { return screenRef_; }
    void setScreenRef(bool value) { screenRef_ = value; }

    /// Raises MalformedDefinition unless X and Y are there for a cartesian position, azimuth and elevation for a polar
    /// one.
    void validate() const override;
    /// `addSubElement_position:attributes:`; raises MalformedDefinition without a "coordinate".
    void addSubElement_position(std::string_view value, const platform::XMLAttributes& attributes);
    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    std::string description() const override;

private:
    ADMPosition position_;
    float width_ = 0;
    float height_ = 0;
    float depth_ = 0;
    float diffuse_ = 0;
    float interpolationLength_ = 0;
    bool hasCartesianX_ = false;
    bool hasCartesianY_ = false;
    bool hasCartesianZ_ = false;
    bool hasPolarAzimuth_ = false;
    bool hasPolarElevation_ = false;
    bool hasPolarDistance_ = false;
    bool hasWidth_ = false;
    bool hasHeight_ = false;
    bool hasDepth_ = false;
    bool jumpPosition_ = false;
    bool screenRef_ = false;
};
