// Names of metadata fields as printed by `meta`, parsed.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// "smpl.loop[0].start": the parts between dots, each with the content of its brackets.
struct MetaName {
    struct Part {
        std::string name;
        std::string index; // "0", "id 7", or a word that begins with "new"; empty if there are no brackets

        /// "[new]", "[new2]" and so on.
        bool isNew() const;
        /// 7 of "[id 7]".
        std::optional<std::size_t> id() const;
        /// 0 without brackets; none if the content is no number.
        std::optional<std::size_t> number() const;
    };

    std::string text;
    std::vector<Part> parts; // the first part names the group
    std::string rest;        // text after the group and its dot

    const std::string& group() const { return parts.front().name; }
    /// The name with N in all brackets: "smpl.loop[N].start"; `keepsFirst` says whether that includes the group's.
    std::string pattern(bool keepsFirst) const;
    /// The name up to the part with that index, brackets included: "cue[3]" for "cue[3].label".
    std::string upTo(std::size_t part) const;
};

/// None if the text cannot be a name.
std::optional<MetaName> metaNameFromText(std::string_view text);
