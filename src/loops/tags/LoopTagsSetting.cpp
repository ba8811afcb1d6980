#include "loops/tags/LoopTagsSetting.h"

#include "loops/VireoLoopTerms.h"
#include "loops/tags/LoopTagsError.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/String.h"

#include <algorithm>
#include <limits>

using platform::Dictionary;
using platform::Value;

namespace {

bool isText(const Value& value)
{
    const auto* const text = value.get<std::string>();
    return text != nullptr && platform::String::fromUTF8(*text);
}

// The number of a field that a word stands for.
std::optional<std::int64_t> numberOfWord(const LoopTagField& field, std::string_view word)
{
    const std::string_view name = field.name;
    return name == "midiRootNote" ? VireoLoopNoteNamed(word)
           : name == "keyType"    ? VireoLoopModeNamed(word)
                                  : std::nullopt;
}

// A frame, or a frame with its type.
std::optional<VireoLoopTransient> transientOf(const Value& value)
{
    constexpr std::int32_t usual = 1; // the type whose meaning is known
    const auto* const typed = value.get<platform::Array>();
    if (typed != nullptr && typed->size() != 2)
        return std::nullopt;
    const auto* const frame = (typed != nullptr ? typed->front() : value).get<std::int64_t>();
    const auto* const type = typed != nullptr ? typed->back().get<std::int64_t>() : nullptr;
    if (frame == nullptr || *frame < 0 || (typed != nullptr && type == nullptr))
        return std::nullopt;
    if (type != nullptr &&
        (*type < std::numeric_limits<std::int16_t>::min() || *type > std::numeric_limits<std::uint16_t>::max()))
        return std::nullopt;
    return VireoLoopTransient(type != nullptr ? static_cast<std::int32_t>(*type) : usual,
                              static_cast<std::uint64_t>(*frame));
}

// Whether frames ascend.
bool areTransients(const platform::Array& list)
{
    std::optional<std::uint64_t> last;
    for (const Value& each : list) {
        const auto transient = transientOf(each);
        if (!transient || (last && transient->frame() <= *last))
            return false;
        last = transient->frame();
    }
    return true;
}

// Transients by their frames; texts by their bytes, each once.
void sortAsFilesHaveIt(platform::Array& list, LoopTagField::Kind kind)
{
    if (kind == LoopTagField::Kind::transients) {
        std::ranges::stable_sort(list, {}, [](const Value& each) {
            const auto transient = transientOf(each);
            return transient ? transient->frame() : 0;
        });
        return;
    }
    const auto textOf = [](const Value& each) {
        const auto* const text = each.get<std::string>();
        return text != nullptr ? std::string_view(*text) : std::string_view();
    };
    std::ranges::stable_sort(list, {}, textOf);
    const auto isRepeated = [&](const Value& a, const Value& b) {
        return a.get<std::string>() != nullptr && b.get<std::string>() != nullptr && textOf(a) == textOf(b);
    };
    list.erase(std::unique(list.begin(), list.end(), isRepeated), list.end());
}

bool isPossible(const LoopTagAssignment& assignment)
{
    const LoopTagField& field = *assignment.field;
    const Value& value = assignment.value;
    const auto* const number = value.get<std::int64_t>();
    const auto* const list = value.get<platform::Array>();
    if (value.isNull())
        return true;
    switch (field.kind) {
    case LoopTagField::Kind::number:
        return number != nullptr && *number >= field.least && *number <= field.most;
    case LoopTagField::Kind::text:
        return isText(value);
    case LoopTagField::Kind::list:
        return list != nullptr && std::ranges::all_of(*list, isText);
    case LoopTagField::Kind::transients:
        return list != nullptr && areTransients(*list);
    }
    return false;
}

bool failForValue(platform::Error* error, const LoopTagField& field)
{
    static constexpr const char* expected[] = {"a whole number from ", "a text in UTF-8", "a list of texts in UTF-8",
                                               "a list of sample frames, each once"};
    std::string text = std::string(field.name) + ": expected " + expected[static_cast<std::size_t>(field.kind)];
    if (field.kind == LoopTagField::Kind::number)
        text += std::to_string(field.least) + " to " + std::to_string(field.most);
    return failWith(error, LoopTagsError::badValue, std::move(text));
}

bool isAssigned(std::span<const LoopTagAssignment> assignments, const LoopTagField& field)
{
    return std::ranges::find(assignments, &field, &LoopTagAssignment::field) != assignments.end();
}

std::string inWords(const Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return std::to_string(*number);
    if (const auto* text = value.get<std::string>())
        return *text;
    std::string joined;
    if (const auto* list = value.get<platform::Array>())
        for (const Value& each : *list)
            joined += (joined.empty() ? "" : ",") + inWords(each);
    return joined.empty() ? "nothing" : joined;
}

std::string containerPhrase(FourCC fileType)
{
    return fileType == kAIFF ? "an AIFF file" : "a CAF file";
}

// Existing transients keep their type unless another one is given.
std::vector<VireoLoopTransient> transientsAt(const Value& frames, const LoopTags& before)
{
    std::vector<VireoLoopTransient> transients;
    const auto* list = frames.get<platform::Array>();
    if (list == nullptr)
        return transients;
    std::map<std::uint64_t, std::int32_t> types;
    for (const VireoLoopTransient& transient : before.transients)
        types.emplace(transient.frame(), transient.transientType());
    for (const Value& each : *list) {
        VireoLoopTransient& transient = transients.emplace_back(*transientOf(each));
        const auto old = types.find(transient.frame());
        if (each.get<platform::Array>() == nullptr && old != types.end())
            transient.setTransientType(old->second);
    }
    return transients;
}

bool canHaveTransients(const LoopTags& tags, platform::Error* error)
{
    if (tags.transients.empty())
        return true;
    constexpr std::uint64_t most = std::numeric_limits<std::uint32_t>::max();
    const std::uint64_t last = tags.transients.back().frame();
    const std::string where = "a transient at frame " + std::to_string(last) + ", but ";
    if (tags.frames > 0 && last > tags.frames)
        return failWith(error, LoopTagsError::cannotKeep,
                        where + "the file ends at frame " + std::to_string(tags.frames));
    return tags.fileType != kAIFF || last <= most ||
           failWith(error, LoopTagsError::cannotKeep,
                    where + "an AIFF file counts no further than " + std::to_string(most));
}

// Beats make a loop of a file that does not state its kind.
void makeLoopOfBeats(const LoopTags& before, std::vector<LoopTagAssignment>& assignments)
{
    const char* const type = VireoLoopCombinedTagsChunkDataFileTypeKey;
    const auto named = [&](const char* key) {
        return std::ranges::find_if(assignments, [&](const LoopTagAssignment& each) {
            return each.field->key != nullptr && each.field->key == std::string_view(key);
        });
    };
    const auto beats = named(VireoLoopCombinedTagsChunkDataBeatCountKey);
    if (beats != assignments.end() && !isAbsentLoopTag(beats->value) && named(type) == assignments.end() &&
        before.fileType == kAIFF && isAbsentLoopTag(loopValueUnder(before.combined, type))) {
        assignments.push_back({loopTagFieldsForKey("loopFileType").front(), {}});
        assignments.back().value = 1; // avoids a false warning of g++ 12 about a value moved into the list
    }
}

// Whether the tags are read back as requested; some tags of a CAF file follow from others.
bool areKept(const Dictionary& wanted, const Dictionary& kept, FourCC fileType,
             std::span<const LoopTagAssignment> assignments, platform::Error* error)
{
    for (const LoopTagField& field : loopTagFields()) {
        if (field.key == nullptr || field.isFileInfo)
            continue;
        const Value want = loopValueUnder(wanted, field.key), have = loopValueUnder(kept, field.key);
        if (want == have || (isAbsentLoopTag(want) && isAbsentLoopTag(have)))
            continue;
        const std::string text = containerPhrase(fileType) + " cannot keep " + field.name + "=" + inWords(want) +
                                 " here: it would be read as " + inWords(have);
        if (isAssigned(assignments, field))
            return failWith(error, LoopTagsError::cannotKeep, text);
        if (fileType != kCaff || field.key != std::string_view(VireoLoopCombinedTagsChunkDataFileTypeKey))
            return failWith(error, LoopTagsError::wouldLose, text + "; set or remove it as well");
    }
    return true;
}

bool areTextsKept(const LoopTags& after, std::span<const LoopTagAssignment> assignments, platform::Error* error)
{
    for (const auto& [field, value] : assignments)
        if (field->isFileInfo && !isAbsentLoopTag(value) && loopValueUnder(after.info, field->key) != value)
            return failWith(error, LoopTagsError::cannotKeep,
                            containerPhrase(after.fileType) + " cannot keep " + field->name + " that long");
    return true;
}

// Also reports what is removed or replaced although the library could not read it.
void tellOfUnreadable(const RawLoopTags& before, const std::vector<LoopTagAssignment>& assignments, LoopTagsPlan& plan)
{
    for (const LoopTagAssignment& assignment : assignments) {
        const LoopTagField& field = *assignment.field;
        RawLoopTags alone = before;
        assignLoopTags(alone, {&assignment, 1});
        if (field.kind == LoopTagField::Kind::transients && isAbsentLoopTag(assignment.value))
            alone.transients.reset();
        // Both parts of a signature count as one tag.
        if (alone == before || field.name == std::string_view("signatureBottom") ||
            std::ranges::any_of(plan.changes, [&](const LoopTagChange& change) { return change.key == field.name; }))
            continue;
        plan.changes.push_back({field.name, "other bytes", {}});
        if (!isAbsentLoopTag(assignment.value))
            plan.changes.back().to = inWords(assignment.value);
    }
}

bool canBeSet(const LoopTags& tags, platform::Error* error)
{
    return tags.fileType == kAIFF || tags.fileType == kCaff ||
           failWith(error, LoopTagsError::otherFile,
                    std::string(tags.fileType == kAIFC ? "is an " : "is a ") + loopContainerName(tags.fileType) +
                        " file; tags are set and removed in AIFF and CAF files only");
}

std::optional<RawLoopTags> rawTagsOf(const platform::URLRef& file, platform::Error* error)
{
    auto manager = openLoopFile(file, platform::AudioFile::Permission::read, LoopFiles::withLoopChunks, error);
    return manager ? readRawLoopTags(*manager, error) : std::nullopt;
}

} // namespace

std::optional<LoopTagAssignment> loopTagAssignment(std::string_view name, platform::Value value, platform::Error* error)
{
    const auto field = std::ranges::find(loopTagFields(), name, [](const LoopTagField& each) { return each.name; });
    if (field == loopTagFields().end()) {
        failWith(error, LoopTagsError::badValue, "there is no tag \"" + std::string(name) + "\"");
        return std::nullopt;
    }
    LoopTagAssignment assignment{&*field, std::move(value)};
    if (const auto* const word = assignment.value.get<std::string>())
        if (const auto number = numberOfWord(*field, *word))
            assignment.value = *number;
    if (auto* const list = assignment.value.get<platform::Array>(); list != nullptr)
        sortAsFilesHaveIt(*list, field->kind);
    if (isPossible(assignment))
        return assignment;
    failForValue(error, *field);
    return std::nullopt;
}

std::optional<LoopTagsPlan> planLoopTagAssignments(const LoopTags& before, const platform::URLRef& file,
                                                   std::span<const LoopTagAssignment> wantedOnes,
                                                   platform::Error* error)
{
    std::vector<LoopTagAssignment> assignments(wantedOnes.begin(), wantedOnes.end());
    for (const LoopTagAssignment& assignment : assignments)
        if (!isPossible(assignment)) {
            failForValue(error, *assignment.field);
            return std::nullopt;
        }
    auto bytes = canBeSet(before, error) ? rawTagsOf(file, error) : std::nullopt;
    if (!bytes)
        return std::nullopt;
    std::optional<LoopTagsPlan> planned(std::in_place);
    LoopTagsPlan& plan = *planned;
    plan.after = before;
    plan.bytes = *bytes;
    makeLoopOfBeats(before, assignments);
    if (!assignLoopTags(plan.bytes, assignments, error))
        return std::nullopt;
    Dictionary wanted = before.combined;
    for (const auto& [field, value] : assignments)
        if (field->kind == LoopTagField::Kind::transients)
            plan.after.transients = transientsAt(value, before);
        else if (!field->isFileInfo && isAbsentLoopTag(value))
            wanted.erase(field->key);
        else if (!field->isFileInfo)
            wanted[field->key] = value;
    plan.after.combined = combinedLoopTagsOf(plan.bytes);
    plan.after.info = loopTextsOf(plan.bytes);
    if (!areKept(wanted, plan.after.combined, before.fileType, assignments, error) ||
        !areTextsKept(plan.after, assignments, error))
        return std::nullopt;
    const bool namesTransients = std::ranges::any_of(
        assignments, [](const auto& each) { return each.field->kind == LoopTagField::Kind::transients; });
    if (namesTransients && (plan.after.transients != before.transients || plan.after.transients.empty())) {
        if (!canHaveTransients(plan.after, error))
            return std::nullopt;
        assignLoopTransients(plan.bytes, plan.after.transients);
    }
    plan.changes = loopTagDifferences(before, plan.after);
    tellOfUnreadable(*bytes, assignments, plan);
    plan.write = [was = std::move(*bytes), after = plan.bytes](VireoLoopChunksManager& manager) {
        return writeRawLoopTags(manager, was, after);
    };
    return planned;
}

std::optional<LoopTagsPlan> planLoopTagsRemoval(const LoopTags& before, const platform::URLRef& file,
                                                platform::Error* error)
{
    auto manager = canBeSet(before, error)
                       ? openLoopFile(file, platform::AudioFile::Permission::read, LoopFiles::withLoopChunks, error)
                       : std::nullopt;
    auto bytes = manager ? readRawLoopTags(*manager, error) : std::nullopt;
    if (!bytes)
        return std::nullopt;
    std::optional<LoopTagsPlan> planned(std::in_place);
    LoopTagsPlan& plan = *planned;
    plan.after.fileType = before.fileType;
    plan.after.sampleRate = before.sampleRate;
    plan.after.frames = before.frames;
    plan.changes = loopTagDifferences(before, plan.after);
    plan.bytes.fileType = before.fileType;
    if (before.fileType == kCaff) { // other texts of "info" are unchanged
        plan.bytes.texts = bytes->texts;
        for (const LoopTagField& field : loopTagFields())
            if (const LoopTagAssignment removal{&field, {}}; field.isFileInfo)
                assignLoopTags(plan.bytes, {&removal, 1});
    }
    if (plan.changes.empty()) { // chunks that say nothing or cannot be read
        for (const LoopTags::Chunk& chunk : loopChunksOf(*manager))
            plan.changes.push_back({chunk.id, std::to_string(chunk.size) + " bytes", {}});
    }
    plan.write = [was = std::move(*bytes), after = plan.bytes](VireoLoopChunksManager& open) {
        return writeRawLoopTags(open, was, after) && open.removeChunks(VireoLoopChunks::Empty());
    };
    return planned;
}
