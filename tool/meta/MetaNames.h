// Names of metadata fields, as `meta` prints them, taken apart.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// "smpl.loop[0].start": the parts between dots, each with what stands in its brackets.
struct MetaName {
    struct Part {
        std::string name;
        std::string index; // "0", "id 7", or a word that begins with "new"; empty: none

        /// "[new]", "[new2]" and so on.
        bool isNew() const;
        /// 7 of "[id 7]".
        std::optional<std::size_t> id() const;
        /// 0 where there is none; none of what is no number.
        std::optional<std::size_t> number() const;
    };

    std::string text;
    std::vector<Part> parts; // the first names the group
    std::string rest;        // behind the group and its dot, as it stands there

    const std::string& group() const { return parts.front().name; }
    /// With N in the place of all that stands in brackets: "smpl.loop[N].start"; `keepsFirst` says whether a group's
    /// brackets count.
    std::string pattern(bool keepsFirst) const;
    /// "cue[3]" of "cue[3].label": up to the part of that index, brackets included.
    std::string upTo(std::size_t part) const;
};

/// None of a text that cannot be a name.
std::optional<MetaName> metaNameFromText(std::string_view text);
