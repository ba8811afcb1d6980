// The fields of one file that can be set in others, in the terms of each kind of container.
#pragma once

#include "tool/meta/MetaCells.h"

class MetaCopySource {
public:
    /// Reads the requested groups; all if empty. Throws Failure.
    MetaCopySource(const std::string& path, MetaGroups groups);

    /// The stages that give a file the source's metadata: lists of points, markers, comments and loops are replaced;
    /// other fields missing in the source stay. Positions are converted to the file's rate.
    std::vector<std::vector<MetaStep>> stagesFor(const HeldMetadata& held, bool isLenient) const;
    /// Fields or groups for which files of the container have no place, in words.
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
