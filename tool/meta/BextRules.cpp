// Sets fields of "bext".
#include "audiofile/metadata/BroadcastExtension.h"
#include "tool/meta/ChunkFields.h"
#include "tool/meta/MetaEdit.h"

#include <fmt/format.h>

#include <array>
#include <cmath>
#include <limits>

namespace {

constexpr FourCC kBextId = fourCC("bext");

/// Creates a chunk of version 1 if the file has none.
template <class Change>
void changeBext(MetaEdit& edit, const MetaStep& step, Change change)
{
    BroadcastExtension fresh;
    fresh.version = 1;
    edit.change(step, kBextId, fresh, change);
}

template <auto member>
void setBext(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) { assign(bext.*member, step); });
}

constexpr std::array kLoudness{&BroadcastExtension::loudnessValue, &BroadcastExtension::loudnessRange,
                               &BroadcastExtension::maxTruePeakLevel, &BroadcastExtension::maxMomentaryLoudness,
                               &BroadcastExtension::maxShortTermLoudness};
constexpr std::array<std::string_view, kLoudness.size()> kLoudnessNames{
    "loudnessValue", "loudnessRange", "maxTruePeakLevel", "maxMomentaryLoudness", "maxShortTermLoudness"};

/// Fields that were reserved bytes, and so are zero, become "unknown".
void raiseVersion(BroadcastExtension& bext, std::uint16_t version)
{
    const bool isNew =
        !bext.hasLoudness() && std::ranges::all_of(kLoudness, [&](auto each) { return bext.*each == 0; });
    if (version >= 2 && isNew)
        for (const auto each : kLoudness)
            bext.*each = BroadcastExtension::kNoLoudness;
    bext.version = version;
}

/// Raises the version for a field that the present one lacks, unless the version itself is set.
void requireVersion(const MetaEdit& edit, const MetaStep& step, BroadcastExtension& bext, std::uint16_t version)
{
    if (bext.version >= version)
        return;
    if (edit.names(step.sibling("version")))
        MetaEdit::refuse(step, fmt::format("version {} of bext has no such field; it is in version {}",
                                           std::uint16_t{bext.version}, version));
    raiseVersion(bext, version);
}

/// A lower version reserves bytes that were fields: these must be empty, or be set as well.
void setVersion(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) {
        const auto version = static_cast<std::uint16_t>(step.number());
        if (version >= bext.version)
            return raiseVersion(bext, version);
        for (std::size_t i = 0; i < kLoudness.size() && bext.hasLoudness() && version < 2; ++i) {
            const std::string name = step.sibling(kLoudnessNames[i]);
            if (bext.*kLoudness[i] != BroadcastExtension::kNoLoudness && !edit.names(name))
                MetaEdit::refuse(step, name + " is in version 2 only: remove it as well");
            bext.*kLoudness[i] = std::int16_t{0};
        }
        if (version < 1 && bext.hasUMID() && !edit.names(step.sibling("umid")))
            MetaEdit::refuse(step, step.sibling("umid") + " is in versions 1 and 2 only: remove it as well");
        if (version < 1)
            bext.umid = {};
        bext.version = version;
    });
}

template <std::size_t index>
void setLoudness(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) {
        if (step.isRemoval() && !bext.hasLoudness())
            return;
        requireVersion(edit, step, bext, 2);
        bext.*kLoudness[index] = step.isRemoval() ? std::int16_t{BroadcastExtension::kNoLoudness}
                                                  : static_cast<std::int16_t>(std::lround(step.decimal() * 100));
    });
}

void setUMID(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) {
        if (!step.isRemoval())
            requireVersion(edit, step, bext, 1);
        if (bext.version < 1)
            return;
        bext.umid = {};
        if (const auto* const umid = std::get_if<Bytes>(&step.value))
            std::ranges::copy(*umid, bext.umid.begin());
    });
}

void setTimeReference(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) {
        bext.setTimeReference(edit.framesOf(step, std::numeric_limits<std::uint64_t>::max()));
    });
}

constexpr std::string_view kLineEnd = "\r\n";

/// Ends lines as the standard requires.
std::string withLineEnds(std::string_view text)
{
    std::string lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find_first_of("\r\n"), text.size());
        if (end != 0)
            (lines += text.substr(0, end)) += kLineEnd;
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

void setHistory(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step,
               [&](BroadcastExtension& bext) { replaceText(bext.codingHistory, withLineEnds(step.string())); });
}

/// Sets one line, counted as shown, without empty lines. Other lines keep their line ends.
void setHistoryLine(MetaEdit& edit, const MetaStep& step)
{
    changeBext(edit, step, [&](BroadcastExtension& bext) {
        std::string text(textOf(bext.codingHistory));
        text.resize(std::min(text.find('\0'), text.size()));
        std::vector<std::pair<std::size_t, std::size_t>> lines;
        for (std::size_t begin = 0; begin < text.size();) {
            const std::size_t end = std::min(text.find_first_of("\r\n", begin), text.size());
            if (end != begin)
                lines.emplace_back(begin, end - begin);
            begin = end + 1;
        }
        const auto index = edit.itemOf(step, 1, lines.size());
        if (!index)
            return;
        if (*index == lines.size()) {
            if (!text.empty() && text.back() != '\n' && text.back() != '\r')
                text += kLineEnd;
            (text += step.string()) += kLineEnd;
        } else if (step.isRemoval()) {
            const auto [begin, size] = lines[*index];
            const std::size_t next = *index + 1 < lines.size() ? lines[*index + 1].first : text.size();
            text.erase(begin, next - begin);
            edit.itemRemoved(step, 1);
        } else {
            text.replace(lines[*index].first, lines[*index].second, step.string());
        }
        replaceText(bext.codingHistory, text);
    });
}

using K = MetaKind;

constexpr MetaRule kBextRules[] = {
    {"bext.description", K::ascii, {0, 256}, setBext<&BroadcastExtension::description>},
    {"bext.originator", K::line, {0, 32}, setBext<&BroadcastExtension::originator>},
    {"bext.originatorReference", K::line, {0, 32}, setBext<&BroadcastExtension::originatorReference>},
    {"bext.originationDate", K::date, {}, setBext<&BroadcastExtension::originationDate>},
    {"bext.originationTime", K::clock, {}, setBext<&BroadcastExtension::originationTime>},
    {"bext.timeReference", K::time, {}, setTimeReference},
    {"bext.version", K::integer, {0, 2}, setVersion},
    {"bext.umid", K::umid, {}, setUMID},
    {"bext.loudnessValue", K::decimal, {-99.99, 99.99}, setLoudness<0>},
    {"bext.loudnessRange", K::decimal, {0, 99.99}, setLoudness<1>},
    {"bext.maxTruePeakLevel", K::decimal, {-99.99, 99.99}, setLoudness<2>},
    {"bext.maxMomentaryLoudness", K::decimal, {-99.99, 99.99}, setLoudness<3>},
    {"bext.maxShortTermLoudness", K::decimal, {-99.99, 99.99}, setLoudness<4>},
    {"bext.codingHistory", K::ascii, kAnyLength, setHistory},
    {"bext.codingHistory[N]", K::line, kAnyLength, setHistoryLine},
    {"bext", K::none, {}, removeChunk<kBextId>},
};

} // namespace

std::span<const MetaRule> bextRules()
{
    return kBextRules;
}
