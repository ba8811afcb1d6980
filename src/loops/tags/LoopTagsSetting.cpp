// ktfiles tags set, and remove: the same edit, with values and without.
#include "media/containers/ContainerHeaders.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/looptags/LoopTagArguments.h"
#include "tool/shared/looptags/LoopTagsEdit.h"
#include "tool/shared/looptags/LoopTagsPatch.h"
#include "tool/shared/output/Failure.h"
#include "tool/tags/TagsCommand.h"

#include <algorithm>
#include <limits>

using platform::Dictionary;
using platform::Value;

namespace {

bool isAssigned(const std::vector<TagAssignment>& assignments, const TagField& field)
{
    return std::any_of(assignments.begin(), assignments.end(),
                       [&](const TagAssignment& assignment) { return assignment.field == &field; });
}

std::string inWords(const Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return std::to_string(*number);
    if (const auto* text = value.get<std::string>())
        return printable(*text);
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

// Transients that were there keep their type, unless another one is named.
std::vector<VireoLoopTransient> transientsAt(const Value& frames, const LoopTags& before)
{
    std::vector<VireoLoopTransient> transients;
    const auto* list = frames.get<platform::Array>();
    if (list == nullptr)
        return transients;
    std::map<std::uint64_t, std::int32_t> types;
    for (const VireoLoopTransient& transient : before.transients)
        types.emplace(transient.frame(), transient.transientType());
    constexpr std::int32_t usual = 1; // the one whose meaning is known
    for (const Value& each : *list) {
        const auto* const typed = each.get<platform::Array>();
        const auto frame = static_cast<std::uint64_t>(*(typed != nullptr ? typed->front() : each).get<std::int64_t>());
        const auto old = types.find(frame);
        transients.emplace_back(typed != nullptr     ? static_cast<std::int32_t>(*typed->back().get<std::int64_t>())
                                : old == types.end() ? usual
                                                     : old->second,
                                frame);
    }
    return transients;
}

void refuseTransients(const std::string& path, const LoopTags& tags)
{
    if (tags.transients.empty())
        return;
    const std::uint64_t last = tags.transients.back().frame();
    if (tags.frames > 0 && last > tags.frames)
        throw UsageError(fmt::format("{}: a transient at frame {}, but the file ends at frame {}", printable(path),
                                     last, tags.frames));
    if (tags.fileType == kAIFF && last > std::numeric_limits<std::uint32_t>::max())
        throw UsageError(fmt::format("{}: a transient at frame {}, but an AIFF file counts no further than {}",
                                     printable(path), last, std::numeric_limits<std::uint32_t>::max()));
}

// Beats make a loop of a file that does not say what it is.
void makeLoopOfBeats(const LoopTags& before, std::vector<TagAssignment>& assignments)
{
    const char* const type = VireoLoopCombinedTagsChunkDataFileTypeKey;
    const auto named = [&](const char* key) {
        return std::ranges::find_if(assignments, [&](const TagAssignment& each) {
            return each.field->key != nullptr && each.field->key == std::string_view(key);
        });
    };
    const auto beats = named(VireoLoopCombinedTagsChunkDataBeatCountKey);
    if (beats != assignments.end() && !isAbsent(beats->value) && named(type) == assignments.end() &&
        before.fileType == kAIFF && isAbsent(valueUnder(before.combined, type))) {
        assignments.push_back({fieldsForKey("loopFileType").front(), {}});
        assignments.back().value = 1; // g++ 12 warns, wrongly, of a value that is moved into the list
    }
}

// A tag that was asked for and cannot be kept is a mistake on the command line; one that would be lost on the way makes
// the edit fail.
void refuseLosses(const std::string& path, const Dictionary& wanted, const Dictionary& kept, FourCC fileType,
                  const std::vector<TagAssignment>& assignments)
{
    for (const TagField& field : tagFields()) {
        if (field.key == nullptr || field.isFileInfo)
            continue;
        const Value want = valueUnder(wanted, field.key), have = valueUnder(kept, field.key);
        if (want == have || (isAbsent(want) && isAbsent(have)))
            continue;
        const bool assigned = isAssigned(assignments, field);
        const std::string text = fmt::format("{} cannot keep {}={} here: it would be read as {}",
                                             containerPhrase(fileType), field.name, inWords(want), inWords(have));
        if (assigned)
            throw UsageError(printable(path) + ": " + text);
        if (fileType != kCaff || field.key != std::string_view(VireoLoopCombinedTagsChunkDataFileTypeKey))
            throw Failure(text + "; set or remove it as well");
    }
}

void refuseLostTexts(const std::string& path, const LoopTags& after, const std::vector<TagAssignment>& assignments)
{
    for (const auto& [field, value] : assignments)
        if (field->isFileInfo && !isAbsent(value) && valueUnder(after.info, field->key) != value)
            throw UsageError(fmt::format("{}: {} cannot keep {} that long", printable(path),
                                         containerPhrase(after.fileType), field->name));
}

// What goes or is replaced though the library could not read it is told as well.
void tellOfUnreadable(const RawLoopTags& before, const std::vector<TagAssignment>& assignments, TagsPlan& plan)
{
    for (const TagAssignment& assignment : assignments) {
        const TagField& field = *assignment.field;
        RawLoopTags alone = before;
        assignTags(alone, {&assignment, 1});
        if (field.kind == TagField::Kind::transients && isAbsent(assignment.value))
            alone.transients.reset();
        // A signature is one thing.
        if (alone == before || field.name == std::string_view("signatureBottom") ||
            std::ranges::any_of(plan.changes, [&](const TagChange& change) { return change.key == field.name; }))
            continue;
        plan.changes.push_back({field.name, "other bytes", {}});
        if (!isAbsent(assignment.value))
            plan.changes.back().to = inWords(assignment.value);
    }
}

void refuseOtherKinds(const LoopTags& tags)
{
    if (tags.fileType != kAIFF && tags.fileType != kCaff)
        throw Failure(fmt::format("is {} {} file; tags are set and removed in AIFF and CAF files only",
                                  tags.fileType == kAIFC ? "an" : "a", loopContainerName(tags.fileType)));
}

TagsPlan planAssignments(const LoopTags& before, const std::string& path, std::vector<TagAssignment> assignments)
{
    refuseOtherKinds(before);
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read);
    const RawLoopTags bytes = readRawLoopTags(manager);
    TagsPlan plan;
    plan.after = before;
    plan.bytes = bytes;
    makeLoopOfBeats(before, assignments);
    assignTags(plan.bytes, assignments);
    Dictionary wanted = before.combined;
    for (const auto& [field, value] : assignments)
        if (field->kind == TagField::Kind::transients)
            plan.after.transients = transientsAt(value, before);
        else if (!field->isFileInfo && isAbsent(value))
            wanted.erase(field->key);
        else if (!field->isFileInfo)
            wanted[field->key] = value;
    plan.after.combined = combinedTagsOf(plan.bytes);
    plan.after.info = infoTextsOf(plan.bytes);
    refuseLosses(path, wanted, plan.after.combined, before.fileType, assignments);
    refuseLostTexts(path, plan.after, assignments);
    const bool namesTransients = std::ranges::any_of(
        assignments, [](const auto& each) { return each.field->kind == TagField::Kind::transients; });
    if (namesTransients && (plan.after.transients != before.transients || plan.after.transients.empty())) {
        refuseTransients(path, plan.after);
        assignTransients(plan.bytes, plan.after.transients);
    }
    plan.changes = differences(before, plan.after);
    tellOfUnreadable(bytes, assignments, plan);
    plan.write = [bytes, after = plan.bytes](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, bytes, after);
    };
    return plan;
}

TagsPlan planRemoval(const LoopTags& before, const std::string& path)
{
    refuseOtherKinds(before);
    TagsPlan plan;
    plan.after.fileType = before.fileType;
    plan.after.sampleRate = before.sampleRate;
    plan.after.frames = before.frames;
    plan.changes = differences(before, plan.after);
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read);
    const RawLoopTags bytes = readRawLoopTags(manager);
    plan.bytes.fileType = before.fileType;
    if (before.fileType == kCaff) { // the other texts of "info" stay as they are
        plan.bytes.texts = bytes.texts;
        for (const TagField& field : tagFields())
            if (const TagAssignment removal{&field, {}}; field.isFileInfo)
                assignTags(plan.bytes, {&removal, 1});
    }
    if (plan.changes.empty()) { // chunks that say nothing, or that cannot be read
        for (const LoopTags::Chunk& chunk : loopChunksOf(manager))
            plan.changes.push_back({chunk.id, fmt::format("{} bytes", chunk.size), {}});
    }
    plan.write = [bytes, after = plan.bytes](VireoLoopChunksManager& file) {
        return writeRawLoopTags(file, bytes, after) && file.removeChunks(VireoLoopChunks::Empty());
    };
    return plan;
}

struct SetArguments {
    std::vector<std::string> words;
    FileArguments files; // those of the list; the others are among the words
    EditOptions options;
};

bool runSet(SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseAssignments(arguments.words);
    arguments.files.names = parsed.files;
    const TagsEditor editor{"set", "set", "would set", [&](const LoopTags& before, const std::string& path) {
                                return planAssignments(before, path, parsed.assignments);
                            }};
    return editTags(arguments.files, editor, arguments.options, output);
}

bool runRemove(SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseKeys(arguments.words);
    arguments.files.names = parsed.files;
    const TagsEditor editor{"remove", "removed", "would remove", [&](const LoopTags& before, const std::string& path) {
                                return parsed.assignments.empty() ? planRemoval(before, path)
                                                                  : planAssignments(before, path, parsed.assignments);
                            }};
    return editTags(arguments.files, editor, arguments.options, output);
}

void declareEdit(CommandLine& commandLine, Verb& tags, const std::string& name, const std::string& description,
                 const std::string& words, SetArguments& arguments, bool (*run)(SetArguments&, const OutputOptions&))
{
    Verb& verb = commandLine.addVerb(
        name, description, [&commandLine, &arguments, run] { return run(arguments, commandLine.output()); }, &tags);
    CommandLine::addFiles(verb, arguments.words).describe(words);
    CommandLine::addFileList(verb, arguments.files);
    CommandLine::addEditOptions(verb, arguments.options);
}

} // namespace

void declareTagsSet(CommandLine& commandLine, Verb& tags)
{
    static SetArguments toSet;
    declareEdit(commandLine, tags, "set", "Set tags; what is not named stays",
                "The audio files, and KEY=VALUE for each tag, as in genre=Jazz, key=F#, signature=4/4", toSet, runSet);
}

void declareTagsRemove(CommandLine& commandLine, Verb& tags)
{
    static SetArguments toRemove;
    declareEdit(commandLine, tags, "remove", "Remove tags, or without keys everything that makes a loop",
                "The audio files, and the KEYs of the tags to remove", toRemove, runRemove);
}
