// A block of a channel that sounds from a place: where it is, how far it extends, how it gets there.
#pragma once

#include "adm/ADMAudioBlockFormat.h"

/// A block with a position.
class KT_EXPORT ADMAudioBlockFormat_Object : public ADMAudioBlockFormat {
public:
    /// Raises what the constructor of ADMAudioBlockFormat raises.
    explicit ADMAudioBlockFormat_Object(const platform::XMLAttributes& attributes) : ADMAudioBlockFormat(attributes) {}
    /// For the factory, which has split the ID already.
    ADMAudioBlockFormat_Object(const Identity& identity, const platform::XMLAttributes& attributes)
        : ADMAudioBlockFormat(identity, attributes)
    {
    }
    ~ADMAudioBlockFormat_Object() override;

    /// Cartesian or polar, as its `cartesian` says; coordinates that are not given keep their defaults.
    const ADMPosition& position() const { return position_; }
    void setPosition(const ADMPosition& value) { position_ = value; }
    /// Whether the document gives X.
    bool hasCartesianX() const { return hasCartesianX_; }
    void setHasCartesianX(bool value) { hasCartesianX_ = value; }
    /// Whether the document gives Y.
    bool hasCartesianY() const { return hasCartesianY_; }
    void setHasCartesianY(bool value) { hasCartesianY_ = value; }
    /// Whether the document gives Z.
    bool hasCartesianZ() const { return hasCartesianZ_; }
    void setHasCartesianZ(bool value) { hasCartesianZ_ = value; }
    /// Whether the document gives an azimuth.
    bool hasPolarAzimuth() const { return hasPolarAzimuth_; }
    void setHasPolarAzimuth(bool value) { hasPolarAzimuth_ = value; }
    /// Whether the document gives an elevation.
    bool hasPolarElevation() const { return hasPolarElevation_; }
    void setHasPolarElevation(bool value) { hasPolarElevation_ = value; }
    /// Whether the document gives a distance.
    bool hasPolarDistance() const { return hasPolarDistance_; }
    void setHasPolarDistance(bool value) { hasPolarDistance_ = value; }
    /// The extent from side to side: degrees for a polar position, 0 to 1 for a cartesian one; 0 when it is not
    /// given.
    float width() const { return width_; }
    void setWidth(float value) { width_ = value; }
    /// The vertical extent, in the unit of width(); 0 when it is not given.
    float height() const { return height_; }
    void setHeight(float value) { height_ = value; }
    /// The extent in distance, a ratio; 0 when it is not given.
    float depth() const { return depth_; }
    void setDepth(float value) { depth_ = value; }
    /// Whether the document gives a width.
    bool hasWidth() const { return hasWidth_; }
    void setHasWidth(bool value) { hasWidth_ = value; }
    /// Whether the document gives a height.
    bool hasHeight() const { return hasHeight_; }
    void setHasHeight(bool value) { hasHeight_ = value; }
    /// Whether the document gives a depth.
    bool hasDepth() const { return hasDepth_; }
    void setHasDepth(bool value) { hasDepth_ = value; }
    /// 0 (direct) to 1 (diffuse), not checked.
    float diffuse() const { return diffuse_; }
    void setDiffuse(float value) { diffuse_ = value; }
    /// Whether the block jumps to its position instead of moving there for as long as it lasts.
    bool jumpPosition() const { return jumpPosition_; }
    void setJumpPosition(bool value) { jumpPosition_ = value; }
    /// How long the jump takes, in seconds; -1 when "jumpPosition" does not tell, 0 when there is no "jumpPosition".
    float interpolationLength() const { return interpolationLength_; }
    void setInterpolationLength(float value) { interpolationLength_ = value; }
    /// Whether the position is relative to the screen.
    bool screenRef() const { return screenRef_; }
    void setScreenRef(bool value) { screenRef_ = value; }

    /// Raises MalformedDefinition unless a cartesian position has X and Y, a polar one azimuth and elevation.
    void validate() const override;
    /// `addSubElement_position:attributes:`: one coordinate. Limits of a position (attribute "bound") are ignored.
    /// Raises MalformedDefinition without a "coordinate".
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
