// What one file has for others: the fields that can be set, in the words of each kind of container.
#pragma once

#include "tool/meta/MetaCells.h"

class MetaCopySource {
public:
    /// Reads the groups that are wanted; empty: all. Throws Failure.
    MetaCopySource(const std::string& path, MetaGroups groups);

    /// The stages that give a file what the source has: lists of points, markers, comments and loops are replaced,
    /// other fields that the source does not have stay. Places in the sound go to the rate of the file.
    std::vector<std::vector<MetaStep>> stagesFor(const HeldMetadata& held, bool isLenient) const;
    /// What files of the container have no place for, by fields or groups, in words.
    const std::vector<std::string>& leftFrom(FourCC container) const { return contentFor(container).left; }
    bool isEmpty() const { return own_.cells.empty(); }

private:
    enum class Family { wave, aiff, caf };
    struct Content {
        std::vector<MetaCell> cells; // in order
        std::vector<std::string> left;
    };

    static Family familyOf(FourCC container);
    static Content contentOf(const HeldMetadata& held, const MetaGroups& groups);
    bool wants(std::string_view group) const;
    Content translated(Family target, bool isLinearPCM) const;
    const Content& contentFor(FourCC container) const;
    std::vector<MetaCell> cellsFor(const HeldMetadata& held) const;

    MetaGroups groups_;
    HeldMetadata held_;
    Content own_;
    std::map<Family, Content> others_;
};
