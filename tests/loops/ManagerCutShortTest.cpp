// Edits of loop tags that are cut short at each single write, by a kill, an error or a full disk.
#include "LoopFiles.h"
#include "support/FaultyDisk.h"

namespace {

struct Layout {
    const char* name;
    FourCC container;
    bool isAhead;         // of the samples
    bool isTwice = false; // a second item of each kind, which must never show
};

struct Edit {
    const char* name;
    std::size_t length; // of the new tags; 0 removes them
    bool apply(const std::string& path) const
    {
        return length == 0 ? manage(path).removeChunks(VireoLoopChunks::Empty())
                           : manage(path).writeChunks(everyKind(length));
    }
};

constexpr std::size_t kOldLength = 20;
const Chunks other{{fourCC("cue "), "other"}};

bool isOf(const Tags& tags, const std::string& key, const std::string& text)
{
    const auto found = tags.find(key);
    return found != tags.end() && found->second == text;
}

} // namespace

class LoopEditCutShort : public testing::TestWithParam<Layout> {
protected:
    void SetUp() override
    {
        const FaultyDisk disk(0, Fault::none);
        Chunks chunks;
        for (const std::size_t length : {kOldLength, kOldLength + 9}) {
            const std::string path = folder.write("file", audioFile(GetParam().container));
            ASSERT_TRUE(manage(path).writeChunks(everyKind(length)));
            const Chunks tagged = walkContainer(readFile(path));
            if (length == kOldLength || GetParam().isTwice)
                chunks.insert(chunks.end(), tagged.begin() + 2, tagged.end());
        }
        chunks.insert(chunks.begin() + 1, other.front());
        original = audioFile(GetParam().container, chunks, GetParam().isAhead);
    }

    /// Whether it succeeded, and the number of calls that changed the file.
    std::pair<bool, int> run(const Edit& edit, int failing, Fault fault)
    {
        std::filesystem::remove(folder / "file");
        folder.write("file", original);
        const FaultyDisk disk(failing, fault);
        const bool isDone = edit.apply(folder / "file");
        return {isDone, FaultyDisk::calls};
    }

    /// Holds at every instant: the file opens, samples and foreign chunks are unchanged, and each tag is the old one or
    /// the new one.
    void check(const Tags& before, const Tags& after)
    {
        const Chunks chunks = walkContainer(readFile(folder / "file"));
        EXPECT_EQ(std::ranges::count(chunks, other.front()), 1);
        EXPECT_EQ(samplesOf(folder / "file"), testSamples);
        const Tags found = tagsOf(folder / "file");
        for (const auto& [key, text] : found)
            EXPECT_TRUE(isOf(before, key, text) || isOf(after, key, text)) << key << "=" << text;
        for (const auto& entry : before)
            EXPECT_TRUE(found.contains(entry.first) || !after.contains(entry.first)) << entry.first << " is lost";
    }

    TemporaryFolder folder;
    Bytes original;
};

TEST_P(LoopEditCutShort, LeavesOldOrNewTags)
{
    for (const Edit& edit : {Edit{"longer", 40}, Edit{"shorter", 5}, Edit{"longer, too", 43}, Edit{"gone", 0}}) {
        SCOPED_TRACE(edit.name);
        run({"none", kOldLength}, 0, Fault::none);
        const Tags before = tagsOf(folder / "file");
        const auto [isDone, calls] = run(edit, 0, Fault::none);
        ASSERT_TRUE(isDone);
        const Tags after = tagsOf(folder / "file");
        ASSERT_EQ(after, edit.length == 0 ? Tags() : keptIn(GetParam().container, everyKind(edit.length)));
        ASSERT_GT(calls, edit.length == 0 ? 3 : 13);
        for (const Fault fault : {Fault::once, Fault::onceAfterHalf, Fault::fromThereOn, Fault::full})
            for (int call = 0; call < calls; ++call) {
                SCOPED_TRACE("fault " + std::to_string(static_cast<int>(fault)) + " at call " + std::to_string(call));
                const bool isDoneAllTheSame = run(edit, call, fault).first;
                check(before, after);
                EXPECT_TRUE(!isDoneAllTheSame || call > 0 || edit.length < kOldLength) << "the fault did not come";
                EXPECT_TRUE(!isDoneAllTheSame || tagsOf(folder / "file") == after) << "it said that all was written";
                const FaultyDisk disk(0, Fault::none);
                ASSERT_TRUE(edit.apply(folder / "file")) << "the file cannot be edited again";
                ASSERT_EQ(tagsOf(folder / "file"), after);
                if (HasFailure())
                    return;
            }
    }
}

INSTANTIATE_TEST_SUITE_P(Layouts, LoopEditCutShort,
                         testing::Values(Layout{"AIFFBehind", kAIFF, false}, Layout{"AIFFAhead", kAIFF, true},
                                         Layout{"CAFBehind", kCAF, false}, Layout{"CAFAhead", kCAF, true},
                                         Layout{"AIFFTwice", kAIFF, true, true}, Layout{"CAFTwice", kCAF, true, true}),
                         [](const auto& layout) { return layout.param.name; });
