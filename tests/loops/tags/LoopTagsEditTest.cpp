// Loop tags as hosts set them, in one call: what they ask for, what is refused, and that others are held back
// meanwhile.
#include "loops/tags/LoopTagsEdit.h"
#include "audiofile/CAudioFileIO.h"
#include "loops/tags/LoopTagsError.h"
#include "media/AudioContainers.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/FileCoordination.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <filesystem>

using platform::Array;
using platform::Value;

namespace {

constexpr FourCC kCAF = fourCC("caff");

class LoopTagsEdit : public testing::Test {
protected:
    LoopTagsEdit() { platform::FileCoordinator::setCoordinationFolder(folder / "coordination"); }
    ~LoopTagsEdit() override { platform::FileCoordinator::setCoordinationFolder({}); }

    std::string file(FourCC container, const Chunks& others = {}) const
    {
        Chunks chunks{formatChunk(container), dataChunk(container)};
        chunks.insert(chunks.end(), others.begin(), others.end());
        return folder.write("loop", buildContainer(container, chunks));
    }
    /// The code of the error; 0 where all went well.
    std::int64_t set(const std::string& path, std::initializer_list<std::pair<const char*, Value>> tags,
                     const CoordinatedEditOptions& options = {})
    {
        std::vector<LoopTagAssignment> assignments;
        for (const auto& [name, value] : tags)
            if (auto one = loopTagAssignment(name, value, &error))
                assignments.push_back(*one);
            else
                return error.code;
        edited = setLoopTags(path, assignments, options, &error);
        return edited ? 0 : error.code;
    }
    static Value valueOf(const std::string& path, const std::string& name)
    {
        for (const LoopTagValue& tag : loopTagRecord(readLoopTags(urlOf(path)).value()))
            if (tag.name == name)
                return tag.value;
        return {};
    }
    std::size_t filesInFolder() const
    {
        const std::filesystem::directory_iterator items(folder.path());
        return static_cast<std::size_t>(
            std::ranges::count_if(items, [](const auto& item) { return item.is_regular_file(); }));
    }

    TemporaryFolder folder;
    platform::Error error;
    std::optional<EditedLoopTags> edited;
};

} // namespace

TEST_F(LoopTagsEdit, IsReadOfAnOpenFileAsOfAPath)
{
    CAudioFileIO open;
    EXPECT_FALSE(readLoopTags(open, &error)) << "not open";
    for (const FourCC container : {kAIFF, kCAF}) {
        const std::string path = file(container);
        ASSERT_EQ(set(path, {{"beatCount", 8}, {"title", "Open"}}), 0) << error.description;
        open.SetCache(1 << 16);
        ASSERT_EQ(open.Open(CFileRef(path.c_str(), false), 0), kStatusOK);
        const auto tags = readLoopTags(open, &error);
        ASSERT_TRUE(tags) << error.description;
        const auto byPath = readLoopTags(urlOf(path));
        EXPECT_EQ(tags->combined, byPath->combined);
        EXPECT_EQ(tags->info, byPath->info);
        EXPECT_EQ(tags->frames, byPath->frames);
        EXPECT_EQ(tags->tempo(), byPath->tempo());
        EXPECT_TRUE(tags->isLoop());
        EXPECT_TRUE(open.IsOpen()) << "and remains so";
    }
    const std::string text = folder.write("text", "no sound at all");
    ASSERT_EQ(open.Open(CFileRef(text.c_str(), false), 0), kStatusOK);
    EXPECT_FALSE(readLoopTags(open, &error));
    EXPECT_EQ(error.code, static_cast<std::int64_t>(LoopTagsError::unknownFile));
}

TEST_F(LoopTagsEdit, SetsWhatIsNamedAndKeepsTheRest)
{
    for (const FourCC container : {kAIFF, kCAF}) {
        const Chunks others{{fourCC("note"), "mine"}};
        const std::string path = file(container, others);
        ASSERT_EQ(set(path, {{"beatCount", 4},
                             {"midiRootNote", "F#"},
                             {"keyType", "minor"},
                             {"genre", "Jazz"},
                             {"title", "Rain"},
                             {"transients", Array{Value(5), Value(2)}}}),
                  0)
            << error.description;
        EXPECT_EQ(edited->changes.size(), 8u) << "and what follows from them";
        ASSERT_EQ(set(path, {{"genre", Value()}, {"signatureTop", 3}, {"signatureBottom", 4}}, {}), 0);
        EXPECT_EQ(valueOf(path, "beatCount"), Value(4));
        EXPECT_EQ(valueOf(path, "key"), Value("F#"));
        EXPECT_EQ(valueOf(path, "mode"), Value("minor"));
        EXPECT_EQ(valueOf(path, "signature"), Value("3/4"));
        EXPECT_EQ(valueOf(path, "title"), Value("Rain"));
        EXPECT_TRUE(valueOf(path, "genre").isNull());
        const auto tags = readLoopTags(urlOf(path));
        ASSERT_EQ(tags->transients.size(), 2u);
        EXPECT_EQ(tags->transients[0].frame(), 2u) << "in their order";
        EXPECT_TRUE(std::ranges::count(walkContainer(readFile(path)), others.front())) << fourCCText(container);
        ASSERT_TRUE(removeLoopTags(path, {}, &error)) << error.description;
        EXPECT_TRUE(readLoopTags(urlOf(path))->isEmpty());
        EXPECT_EQ(filesInFolder(), 1u);
    }
}

TEST_F(LoopTagsEdit, RefusesAndLeavesTheFileAsItWas)
{
    const auto code = [](LoopTagsError each) { return static_cast<std::int64_t>(each); };
    const std::string path = file(kAIFF);
    const Bytes before = readFile(path);
    const std::pair<const char*, Value> impossible[] = {{"tempo", 120},
                                                        {"beatCount", -1},
                                                        {"beatCount", "many"},
                                                        {"keyType", 5},
                                                        {"title", 3},
                                                        {"title", "\xFF"},
                                                        {"descriptors", "Dark"},
                                                        {"descriptors", Array{Value(1)}},
                                                        {"transients", Array{Value(-1)}},
                                                        {"transients", Array{Value(1), Value(1)}},
                                                        {"transients", Array{Value(Array{Value(1)})}},
                                                        {"transients", Array{Value(Array{Value(1), Value(70000)})}}};
    for (const auto& each : impossible)
        EXPECT_EQ(set(path, {each}), code(LoopTagsError::badValue)) << each.first;
    EXPECT_EQ(set(path, {{"transients", Array{Value(900)}}}), code(LoopTagsError::cannotKeep)) << "behind the sound";
    EXPECT_EQ(set(path, {{"genre", std::string(60, 'g')}}), code(LoopTagsError::cannotKeep));
    EXPECT_EQ(readFile(path), before);
    EXPECT_EQ(set(file(kWAVE), {{"genre", "Jazz"}}), code(LoopTagsError::otherFile));
    EXPECT_EQ(set(folder.write("text", "no sound"), {{"genre", "Jazz"}}), code(LoopTagsError::unknownFile));
    EXPECT_EQ(set(folder / "missing", {{"genre", "Jazz"}}), kStatusFileNotFound);
    EXPECT_EQ(error.domain, platform::ErrorDomain::status);
    EXPECT_FALSE(copyLoopTags(file(kAIFF), file(kCAF), {}, &error)) << "of a file that has none";
}

TEST_F(LoopTagsEdit, CopiesBetweenKindsOfFiles)
{
    const std::string source = folder / "source";
    std::filesystem::rename(file(kCAF), source);
    ASSERT_EQ(set(source, {{"beatCount", 2}, {"midiRootNote", 50}, {"genre", "Jazz"}}), 0) << error.description;
    for (const FourCC container : {kAIFF, kWAVE}) {
        const std::string path = file(container);
        const auto copied = copyLoopTags(source, path, {}, &error);
        ASSERT_TRUE(copied) << error.description;
        SCOPED_TRACE(fourCCText(container));
        EXPECT_EQ(valueOf(path, "midiRootNote"), Value(50));
        EXPECT_EQ(valueOf(path, "genre"), container == kAIFF ? Value("Jazz") : Value());
        EXPECT_EQ(copied->notKept.empty(), container == kAIFF) << "WAVE has no room for a genre";
    }
}

TEST_F(LoopTagsEdit, WaitsForOthersNoLongerThanItMay)
{
    const std::string path = file(kAIFF);
    const Bytes before = readFile(path);
    CoordinatedEditOptions options;
    options.timeoutSeconds = 0.2;
    {
        const auto reading = platform::FileCoordinator().openForReading(urlOf(path), {});
        ASSERT_TRUE(reading);
        EXPECT_EQ(set(path, {{"genre", "Jazz"}}, options), kStatusFileBusy);
    }
    {
        CSafeEdit other;
        ASSERT_FALSE(other.Begin(path));
        EXPECT_EQ(set(path, {{"genre", "Jazz"}}, options), kStatusFileBusy) << "which knows nothing of coordination";
    }
    EXPECT_EQ(readFile(path), before);
    options.backup = true;
    EXPECT_EQ(set(path, {{"genre", "Jazz"}}, options), 0) << "what was waited for in vain was given back";
    EXPECT_EQ(readFile(edited->backup), before);
}
