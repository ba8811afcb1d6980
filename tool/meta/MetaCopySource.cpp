#include "tool/meta/MetaCopySource.h"

#include "media/containers/ContainerHeaders.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/metadata/MetaFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/portable/PortableMarkers.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <set>

namespace {

/// The list that is replaced as a whole: "cue", "smpl.loop"; empty for other fields.
std::string listOf(const MetaName& name)
{
    const std::string& group = name.group();
    if (group == "cue" || group == "mark" || group == "comt")
        return group;
    return group == "smpl" && name.parts.size() > 1 && name.parts[1].name == "loop" ? "smpl.loop" : "";
}

/// The list item to which a field belongs.
std::string itemOf(const MetaName& name)
{
    return name.upTo(name.group() == "smpl" ? 1 : 0);
}

/// Ids of CAF's markers refer to texts, which differ in every file.
bool isOwnId(const MetaName& name, FourCC container)
{
    return container == kCaff && (name.group() == "strg" || (name.group() == "mark" && name.rest == "id"));
}

void sortCells(std::vector<MetaCell>& cells)
{
    std::vector<MetaName> names;
    std::ranges::transform(cells, std::back_inserter(names), &MetaCell::name);
    std::vector<MetaCell> sorted;
    for (const std::size_t index : inOrder(names))
        sorted.push_back(std::move(cells[index]));
    cells = std::move(sorted);
}

/// A number of frames at another rate; unchanged if it is not a number.
std::string scaled(const std::string& text, const SoundChange& change)
{
    std::uint64_t frames = 0;
    const char* const end = text.data() + text.size();
    if (std::from_chars(text.data(), end, frames).ptr != end) {
        double exact = 0; // CAF has positions between frames
        if (std::from_chars(text.data(), end, exact).ptr != end || !(exact >= 0 && exact < 1e15))
            return text;
        const double ratio = change.keepsRate() ? 1 : change.rate / change.sourceRate;
        return std::to_string(std::llround(exact * ratio));
    }
    return std::to_string(change.scaled(frames));
}

void addOnce(std::vector<std::string>& names, const std::string& name)
{
    if (std::ranges::find(names, name) == names.end())
        names.push_back(name);
}

} // namespace

MetaCopySource::MetaCopySource(const std::string& path, MetaGroups groups) : groups_(std::move(groups))
{
    CAudioFileIO file;
    openChunks(file, path);
    held_ = holdMetadata(path, groups_);
    own_ = contentOf(held_, groups_);
    for (const Family family : {Family::wave, Family::aiff, Family::caf})
        if (family != familyOf(held_.container))
            others_[family] = translated(family, file.Info().IsLinearPCM());
}

MetaCopySource::Family MetaCopySource::familyOf(FourCC container)
{
    return container == kFORM ? Family::aiff : container == kCaff ? Family::caf : Family::wave;
}

MetaCopySource::Content MetaCopySource::contentOf(const HeldMetadata& held, const MetaGroups& groups)
{
    Content content{cellsOf(held, groups), {}};
    std::erase_if(content.cells, [&](const MetaCell& cell) { return isOwnId(cell.name, held.container); });
    sortCells(content.cells);
    return content;
}

bool MetaCopySource::wants(std::string_view group) const
{
    return groups_.empty() || std::ranges::find(groups_, group) != groups_.end();
}

/// Translates through chunks of the target's kind, whose fields are then copied.
MetaCopySource::Content MetaCopySource::translated(Family target, bool isLinearPCM) const
{
    const Family family = familyOf(held_.container);
    PortableTexts texts;
    PortableMarkers markers;
    std::vector<std::string> left;
    std::vector<BytesView> lists;
    BytesView names;
    std::set<std::string_view> known{"info", "cue", "NAME", "AUTH", "(c)", "ANNO", "mark", "comt"};
    for (const MetaChunk& chunk : held_.source.chunks) {
        if (!chunk.isHeld || std::ssize(chunk.body) != chunk.size)
            continue;
        if (family == Family::wave && chunk.id == fourCC("LIST")) {
            lists.emplace_back(chunk.body);
            if (wants("info"))
                texts.addFromWAVE(chunk.body, held_.source.order);
        } else if (family == Family::aiff && chunk.id == fourCC("COMT")) {
            if (texts.addComments(chunk.body))
                left.emplace_back("comments on markers");
        } else if (family == Family::aiff && chunk.id != fourCC("MARK")) {
            texts.addFromAIFF(chunk.id, chunk.body);
        } else if (family == Family::caf && chunk.id == fourCC("info")) {
            texts.addFromCAF(chunk.body);
        } else if (family == Family::caf && chunk.id == fourCC("strg")) {
            names = chunk.body;
        }
    }
    for (const MetaChunk& chunk : held_.source.chunks)
        if (chunk.id == fourCC("cue ") && chunk.isHeld)
            markers.addFromWAVE(chunk.body, lists, held_.source.order, isLinearPCM);
        else if (chunk.id == fourCC("MARK") && chunk.isHeld)
            markers.addFromAIFF(chunk.body);
        else if (chunk.id == fourCC("mark") && chunk.isHeld)
            markers.addFromCAF(chunk.body, names);
    HeldMetadata made;
    made.container = target == Family::wave ? fourCC("RIFF") : target == Family::aiff ? kFORM : kCaff;
    made.kind = target == Family::wave   ? platform::ContainerKind::riff
                : target == Family::aiff ? platform::ContainerKind::iff
                                         : platform::ContainerKind::caf;
    made.source.order = target == Family::wave ? std::endian::little : std::endian::big;
    made.sampleRate = held_.sampleRate;
    const FourCC type = target == Family::wave ? kWAVE : target == Family::aiff ? kAIFF : kCaff;
    std::size_t leftMarkers = 0;
    for (const auto& chunks : {texts.chunksFor(type, left), markers.chunksFor(type, leftMarkers)})
        for (const HeldChunk& chunk : chunks)
            made.source.chunks.push_back(
                {chunk.id, std::ssize(made.source.chunks), std::ssize(chunk.body), chunk.body});
    for (const std::string& other : texts.others)
        left.push_back("info." + other);
    if (leftMarkers != 0)
        left.push_back(fmt::format("{} markers", leftMarkers));
    if (markers.hasMore)
        left.emplace_back("remarks on points and ranges");
    for (const MetaCell& cell : own_.cells)
        if (!known.contains(cell.name.group()))
            addOnce(left, cell.name.group());
    Content content = contentOf(made, {});
    content.left = std::move(left);
    return content;
}

const MetaCopySource::Content& MetaCopySource::contentFor(FourCC container) const
{
    const auto found = others_.find(familyOf(container));
    return found != others_.end() ? found->second : own_;
}

/// With positions at the target's rate, without what describes only the source's sound.
std::vector<MetaCell> MetaCopySource::cellsFor(const HeldMetadata& held) const
{
    const SoundChange change{.sourceRate = held_.sampleRate, .rate = held.sampleRate};
    const std::vector<MetaCell> there = cellsOf(held);
    const auto version = std::ranges::find(there, "bext.version", [](const MetaCell& cell) { return cell.name.text; });
    std::vector<MetaCell> cells;
    for (MetaCell cell : contentFor(held.container).cells) {
        const MetaRule* const rule = ruleFor(cell.name, held.container);
        if (rule != nullptr && rule->kind == MetaKind::time)
            cell.text = scaled(cell.text, change);
        const bool isOlder = cell.name.text == "bext.version" && version != there.end() && cell.text < version->text;
        const bool isOfRate = cell.name.text == "smpl.samplePeriod" && !change.keepsRate();
        if (!isOlder && !isOfRate)
            cells.push_back(std::move(cell));
    }
    return cells;
}

std::vector<std::vector<MetaStep>> MetaCopySource::stagesFor(const HeldMetadata& held, bool isLenient) const
{
    using Texts = std::map<std::string, std::string>;
    std::vector<MetaCell> cells = cellsFor(held);
    std::map<std::string, Texts> here, there; // fields of each list
    std::map<std::string, std::vector<std::string>> items;
    for (const MetaCell& cell : cells)
        if (const std::string list = listOf(cell.name); !list.empty())
            here[list].emplace(cell.name.text, cell.text);
    for (const MetaCell& cell : cellsOf(held))
        if (const std::string list = listOf(cell.name); !list.empty()) {
            addOnce(items[list], itemOf(cell.name));
            if (!isOwnId(cell.name, held.container))
                there[list].emplace(cell.name.text, cell.text);
        }
    std::vector<MetaStep> removals;
    for (const auto& [list, texts] : here)
        if (texts != there[list])
            for (const std::string& item : items[list])
                removals.push_back(metaStep(item, std::nullopt, isLenient));
    std::erase_if(cells, [&](const MetaCell& cell) {
        const std::string list = listOf(cell.name);
        return !list.empty() && here[list] == there[list];
    });
    HeldMetadata cleared = held;
    MetaEdit(cleared, removals, isLenient).apply();
    return {removals, stepsTo(cells, cleared, false, isLenient)};
}
