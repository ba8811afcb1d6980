// ktfiles tags set, and remove: the same edit, with values and without.
#include "CommandLine.h"
#include "Failure.h"
#include "LoopTagFields.h"
#include "LoopTagsEdit.h"
#include "TagsCommand.h"
#include "audiofile/ContainerHeaders.h"

#include <algorithm>
#include <limits>

using platform::Dictionary;
using platform::Value;

namespace {

constexpr std::int32_t kTransientType = 1; // the one whose meaning is known
constexpr std::int32_t kTransientsVersion = 1;

bool isAssigned(const std::vector<TagAssignment>& assignments, const TagField& field)
{
    return std::any_of(assignments.begin(), assignments.end(),
                       [&](const TagAssignment& assignment) { return assignment.field == &field; });
}

Value valueUnder(const Dictionary& values, const char* key)
{
    const auto found = values.find(key);
    return found == values.end() ? Value() : found->second;
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

// Transients that were there keep their type.
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
        const auto frame = static_cast<std::uint64_t>(*each.get<std::int64_t>());
        const auto old = types.find(frame);
        transients.emplace_back(old == types.end() ? kTransientType : old->second, frame);
    }
    return transients;
}

void refuseTransients(const std::string& path, const LoopTags& tags)
{
    if (tags.transients.empty())
        return;
    const std::uint64_t last = tags.transients.back().frame();
    if (tags.frames > 0 && last > tags.frames)
        throw CLI::ValidationError(fmt::format("{}: a transient at frame {}, but the file ends at frame {}",
                                               printable(path), last, tags.frames));
    if (tags.fileType == kAIFF && last > std::numeric_limits<std::uint32_t>::max())
        throw CLI::ValidationError(
            fmt::format("{}: a transient at frame {}, but an AIFF file counts no further than {}", printable(path),
                        last, std::numeric_limits<std::uint32_t>::max()));
}

void assignTo(LoopTags& tags, const TagAssignment& assignment, const LoopTags& before)
{
    const TagField& field = *assignment.field;
    if (field.kind == TagField::Kind::transients) {
        tags.transients = transientsAt(assignment.value, before);
        return;
    }
    Dictionary& values = field.isFileInfo ? tags.info : tags.combined;
    if (isAbsent(assignment.value))
        values.erase(field.key);
    else
        values[field.key] = assignment.value;
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
            throw CLI::ValidationError(printable(path) + ": " + text);
        if (fileType != kCaff || field.key != std::string_view(VireoLoopCombinedTagsChunkDataFileTypeKey))
            throw Failure(text + "; set or remove it as well");
    }
}

void refuseLongComments(const std::string& path, const LoopTags& tags)
{
    const std::string comments = tags.text(VireoLoopFileInfoChunkDataCommentsKey);
    using Types = VireoLoopFileInfoChunkDataTypes;
    if (tags.fileType == kAIFF && !comments.empty() &&
        Types::commentStringFromAifCommentChunkData(Types::commentDataFromAifCommentChunkStrings(comments)) != comments)
        throw CLI::ValidationError(printable(path) + ": an AIFF file cannot keep comments that long");
}

bool writeTransients(VireoLoopChunksManager& manager, const std::vector<VireoLoopTransient>& transients)
{
    VireoLoopChunkList list;
    list.push_back(std::make_unique<VireoLoopTransientChunk>());
    auto& data = static_cast<VireoLoopTransientChunk&>(*list.front()).transients();
    manager.readChunks(list); // for the fields beside the list
    data.setTransients(transients);
    if (!data.version())
        data.setVersion(kTransientsVersion);
    return transients.empty() ? manager.removeChunks(list) : manager.writeChunks(list);
}

TagsPlan planAssignments(const LoopTags& before, const std::string& path, const std::vector<TagAssignment>& assignments)
{
    TagsPlan plan;
    plan.after = before;
    for (const TagAssignment& assignment : assignments)
        assignTo(plan.after, assignment, before);
    Dictionary& combined = plan.after.combined;
    if (combined != before.combined) {
        // Beats make a loop of a file that does not say what it is.
        const char* const type = VireoLoopCombinedTagsChunkDataFileTypeKey;
        if (isAbsent(valueUnder(combined, type)) &&
            !isAbsent(valueUnder(combined, VireoLoopCombinedTagsChunkDataBeatCountKey)))
            combined[type] = 1;
        const Dictionary kept = keptCombinedTags(combined, before.fileType);
        refuseLosses(path, combined, kept, before.fileType, assignments);
        combined = kept;
    }
    if (plan.after.transients != before.transients)
        refuseTransients(path, plan.after);
    refuseLongComments(path, plan.after);
    plan.changes = differences(before, plan.after);
    plan.write = [before, after = plan.after](VireoLoopChunksManager& manager) {
        return (before.combined == after.combined || writeCombinedTags(manager, after.combined)) &&
               (before.transients == after.transients || writeTransients(manager, after.transients)) &&
               writeFileInfo(manager, before.info, after.info);
    };
    return plan;
}

TagsPlan planRemoval(const LoopTags& before, const std::string& path)
{
    TagsPlan plan;
    plan.after.fileType = before.fileType;
    plan.after.sampleRate = before.sampleRate;
    plan.after.frames = before.frames;
    plan.changes = differences(before, plan.after);
    if (plan.changes.empty()) { // chunks that say nothing, or that cannot be read
        VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read);
        for (const LoopTags::Chunk& chunk : loopChunksOf(manager))
            plan.changes.push_back({chunk.id, fmt::format("{} bytes", chunk.size), {}});
    }
    plan.write = [](VireoLoopChunksManager& manager) { return manager.removeChunks(VireoLoopChunks::Empty()); };
    return plan;
}

struct SetArguments {
    std::vector<std::string> words;
    EditOptions options;
};

bool runSet(const SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseAssignments(arguments.words);
    const TagsEditor editor{"set", "set", "would set", [&](const LoopTags& before, const std::string& path) {
                                return planAssignments(before, path, parsed.assignments);
                            }};
    return editTags(parsed.files, editor, arguments.options, output);
}

bool runRemove(const SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseKeys(arguments.words);
    const TagsEditor editor{"remove", "removed", "would remove", [&](const LoopTags& before, const std::string& path) {
                                return parsed.assignments.empty() ? planRemoval(before, path)
                                                                  : planAssignments(before, path, parsed.assignments);
                            }};
    return editTags(parsed.files, editor, arguments.options, output);
}

void declareEdit(CommandLine& commandLine, CLI::App& tags, const std::string& name, const std::string& description,
                 const std::string& words, SetArguments& arguments,
                 bool (*run)(const SetArguments&, const OutputOptions&))
{
    CLI::App& verb = commandLine.addVerb(
        name, description, [&commandLine, &arguments, run] { return run(arguments, commandLine.output()); }, &tags);
    CommandLine::addFiles(verb, arguments.words)->required()->description(words);
    CommandLine::addEditOptions(verb, arguments.options);
}

} // namespace

void declareTagsSet(CommandLine& commandLine, CLI::App& tags)
{
    static SetArguments toSet;
    declareEdit(commandLine, tags, "set", "Set tags; what is not named stays",
                "The audio files, and KEY=VALUE for each tag, as in genre=Jazz, key=F#, signature=4/4", toSet, runSet);
}

void declareTagsRemove(CommandLine& commandLine, CLI::App& tags)
{
    static SetArguments toRemove;
    declareEdit(commandLine, tags, "remove", "Remove tags, or without keys everything that makes a loop",
                "The audio files, and the KEYs of the tags to remove", toRemove, runRemove);
}
