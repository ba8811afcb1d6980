// Tags and texts of one file put into the chunks of another: unchanged between files of one kind, by their meaning
// between AIFF and CAF.
#pragma once

#include "loops/tags/LoopTags.h"
#include "loops/tags/LoopTagsPatch.h"

#include <string>
#include <vector>

/// Carries each field by itself: one that cannot be kept is reported, and costs no other.
class LoopTagsCarrier {
public:
    /// `tags` and `from` are of the same file; everything is borrowed.
    LoopTagsCarrier(const LoopTags& tags, const RawLoopTags& from, RawLoopTags& to, std::vector<std::string>& notKept);

    /// Does it; fields that are lost are in `notKept`, in words.
    void carry();

private:
    void carryNumbers(const std::vector<const LoopTagField*>& fields);
    void carryText(const LoopTagField& field);
    void carryDescriptors(const LoopTagField& field);
    bool assign(std::span<const LoopTagAssignment> assignments, bool mustBeRead);
    bool isKept(const LoopTagField& field, const std::string& descriptor) const;
    void lose(const std::string& name, const std::string& value, const std::string& why = {});

    const LoopTags& tags_;
    const RawLoopTags& from_;
    RawLoopTags& to_;
    std::vector<std::string>& notKept_;
    bool isSameKind_;
    std::string why_; // reason of the last assignment that failed
};
