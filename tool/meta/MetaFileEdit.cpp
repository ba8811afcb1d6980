#include "tool/meta/MetaFileEdit.h"

#include "audiofile/ContainerChanges.h"
#include "media/containers/ContainerHeaders.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Status.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/metadata/MetaFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <set>

using platform::AudioFile;

namespace {

std::vector<const MetaChunk*> chunksOf(const HeldMetadata& held, FourCC id)
{
    std::vector<const MetaChunk*> chunks;
    for (const MetaChunk& chunk : held.source.chunks)
        if (chunk.id == id)
            chunks.push_back(&chunk);
    return chunks;
}

/// Chunks keep their offset in the plan, which identifies them before and after.
void addItems(MetaPlan& plan, FourCC id)
{
    const auto before = chunksOf(plan.before, id), after = chunksOf(plan.after, id);
    std::vector<MetaItemEdit> removals;
    for (std::uint32_t index = 0; index < before.size(); ++index) {
        const auto now = std::ranges::find(after, before[index]->offset, &MetaChunk::offset);
        if (now == after.end())
            removals.push_back({id, index, std::nullopt});
        else if ((*now)->body != before[index]->body)
            plan.items.push_back({id, index, (*now)->body});
    }
    auto index = static_cast<std::uint32_t>(before.size());
    for (const MetaChunk* chunk : after)
        if (chunk->offset < 0)
            plan.items.push_back({id, index++, chunk->body});
    plan.items.insert(plan.items.end(), removals.begin(), removals.end());
}

bool isBelow(std::string_view field, std::string_view item)
{
    return field.starts_with(item) && (field.size() == item.size() || field[item.size()] == '.');
}

/// Compares numbers as they are shown; all NaNs are equal.
bool isSame(const MetaField::Value& a, const MetaField::Value& b)
{
    const auto isNone = [](const MetaField::Value& value) {
        const auto* const number = std::get_if<double>(&value);
        return number != nullptr && std::isnan(*number);
    };
    return a == b || (isNone(a) && isNone(b));
}

/// Fields that existed, exist now, or both. After removing an item by index, later items have other names, which is not
/// a change: in that group only the item's own fields and those that were set count.
std::vector<MetaChange> changesOf(const MetaPlan& plan, const std::vector<std::string>& removedItems,
                                  const std::vector<MetaStep>& steps)
{
    std::set<std::string, std::less<>> shifted;
    for (const std::string& item : removedItems)
        shifted.insert(item.substr(0, item.find_first_of(".[")));
    std::map<std::string, const MetaField*, std::less<>> before, after;
    const std::vector<MetaField> fieldsBefore = MetadataFieldsOf(plan.before),
                                 fieldsAfter = MetadataFieldsOf(plan.after);
    for (const MetaField& field : fieldsBefore)
        before.emplace(field.fullName(), &field);
    for (const MetaField& field : fieldsAfter)
        after.emplace(field.fullName(), &field);
    std::vector<MetaChange> changes;
    for (const MetaField& field : fieldsAfter) {
        const std::string name = field.fullName();
        const auto old = before.find(name);
        if (shifted.contains(field.group) || (old != before.end() && isSame(old->second->value, field.value)))
            continue;
        changes.push_back({name, old != before.end() ? std::optional(old->second->value) : std::nullopt, field.value});
    }
    for (const MetaField& field : fieldsBefore) {
        const std::string name = field.fullName();
        const bool isNamed = std::ranges::any_of(steps, [&](const MetaStep& step) {
            return (!step.text || step.text->empty()) && isBelow(name, step.name.text);
        });
        if (shifted.contains(field.group) ? isNamed : !after.contains(name))
            changes.push_back({name, field.value, std::nullopt});
    }
    for (const MetaStep& step : steps)
        if (step.text && !step.text->empty() && shifted.contains(step.name.group()))
            changes.push_back({step.name.text, std::nullopt, *step.text});
    return changes;
}

/// Refuses for example an unfinished recording after the chunks. A chunk that keeps its size is written in place.
void requireRoom(const std::string& path, const MetaPlan& plan)
{
    const bool staysInPlace = std::ranges::all_of(plan.items, [&](const MetaItemEdit& item) {
        const auto before = chunksOf(plan.before, item.id);
        return item.body && item.index < before.size() && std::ssize(*item.body) == before[item.index]->size;
    });
    if (staysInPlace)
        return;
    constexpr FourCC some = fourCC("bext"); // a kind of chunk of which there may be several
    CAudioFileIO file;
    openContainer(file, path, 0);
    if (const auto objection = objectionToAdding(file, surveyChunks(file, some), some))
        throw Failure(*objection);
}

std::unique_ptr<AudioFile> openItems(const std::string& path, AudioFile::Permission permission)
{
    std::int32_t status = kStatusOK;
    auto file = AudioFile::open(*fileLocation(path), permission, 0, &status);
    if (file == nullptr)
        requireOK(status);
    return file;
}

} // namespace

HeldMetadata holdEdited(const std::string& path, const MetaGroups& groups)
{
    const auto isEdited = [](FourCC container) {
        constexpr std::array edited{kRIFF, kRF64, kBW64, kFORM, kCaff};
        return std::ranges::find(edited, container) != edited.end();
    };
    CAudioFileIO file;
    const ContainerProblem problem = OpenContainer(file, referenceTo(path), 0);
    if (problem.kind == ContainerProblem::Kind::noContainer)
        requireKnown(path); // knows best what is wrong with a file that is no audio
    HeldMetadata held;
    if (!problem)
        held = holdMetadata(path, groups);
    else if (problem.kind != ContainerProblem::Kind::noContainer && problem.kind != ContainerProblem::Kind::onlyRead)
        requireNone(problem);
    if (!isEdited(held.container))
        throw OtherKind("metadata of its kind of file is only read; that of WAVE, RF64, BW64, AIFF, AIFC and CAF files "
                        "is edited",
                        OtherKind::Kind::audio);
    return held;
}

namespace {

MetaPlan planInStages(const std::string& path, const MetaStages& stagesFor, bool isLenient, bool makesNext)
{
    MetaPlan plan;
    plan.before = holdEdited(path);
    plan.after = plan.before;
    std::set<FourCC> touched;
    std::vector<std::string> removedItems;
    std::vector<MetaStep> steps;
    for (const std::vector<MetaStep>& stage : stagesFor(plan.before)) {
        MetaEdit edit(plan.after, stage, isLenient, makesNext);
        edit.apply();
        touched.insert(edit.touched().begin(), edit.touched().end());
        removedItems.insert(removedItems.end(), edit.removedItems().begin(), edit.removedItems().end());
        steps.insert(steps.end(), stage.begin(), stage.end());
    }
    for (const FourCC id : touched)
        addItems(plan, id);
    for (const MetaItemEdit& item : plan.items)
        if (std::ranges::find(plan.ids, item.id) == plan.ids.end())
            plan.ids.push_back(item.id);
    requireRoom(path, plan);
    if (!plan.items.empty())
        plan.changes = changesOf(plan, removedItems, steps);
    return plan;
}

} // namespace

MetaPlan planMetadata(const std::string& path, const std::vector<MetaStep>& steps, bool isLenient)
{
    return planInStages(
        path, [&](const HeldMetadata&) { return std::vector<std::vector<MetaStep>>{steps}; }, isLenient, false);
}

MetaPlan planMetadata(const std::string& path, const MetaStages& stagesFor, bool isLenient)
{
    return planInStages(path, stagesFor, isLenient, true);
}

void writeMetadata(const std::string& path, const MetaPlan& plan)
{
    {
        const auto file = openItems(path, AudioFile::Permission::readWrite);
        for (const FourCC id : plan.ids) {
            const auto before = chunksOf(plan.before, id);
            std::uint32_t count = 0, size = 0;
            requireOK(file->countUserData(id, count));
            if (count != before.size())
                throw Failure(fmt::format("its chunks \"{}\" are not all in its container", fourCCText(id)));
            for (std::uint32_t index = 0; index < count; ++index)
                if (requireOK(file->userDataSize(id, index, size)); std::int64_t{size} != before[index]->size)
                    throw Failure(fmt::format("its chunk \"{}\" is damaged", fourCCText(id)));
        }
        std::map<FourCC, std::vector<std::uint32_t>> removals;
        for (const MetaItemEdit& item : plan.items) {
            if (!item.body)
                removals[item.id].push_back(item.index);
            else if (item.body->size() > std::numeric_limits<std::uint32_t>::max())
                throw Failure(fmt::format("its chunk \"{}\" would be too large", fourCCText(item.id)));
            else
                requireOK(file->setUserData(item.id, item.index, static_cast<std::uint32_t>(item.body->size()),
                                            item.body->data()));
        }
        for (const auto& [id, indices] : removals)
            requireOK(file->removeUserData(id, indices));
    }
    const HeldMetadata found = holdMetadata(path);
    for (const FourCC id : plan.ids)
        if (!std::ranges::equal(chunksOf(found, id), chunksOf(plan.after, id),
                                [](const MetaChunk* a, const MetaChunk* b) { return a->body == b->body; }))
            throw Failure(fmt::format("its chunk \"{}\" is not found as it should be after the edit", fourCCText(id)));
}
