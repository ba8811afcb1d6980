// Edits of user data that are cut short at each single call, and files that are edited again and again.
#include "AudioContainers.h"
#include "platform/core/Status.h"
#include "support/FaultInjection.h"
#include "support/FaultyDisk.h"

#include <algorithm>
#include <filesystem>
#include <numeric>

using namespace platform;

namespace {

constexpr FourCC kItem = fourCC("uuid"); // the type that is edited; others must not change

std::vector<std::string> bodiesOf(const Chunks& chunks, FourCC id)
{
    std::vector<std::string> bodies;
    for (const auto& chunk : chunks)
        if (chunk.first == id)
            bodies.push_back(chunk.second);
    return bodies;
}

Chunks without(Chunks chunks, FourCC id)
{
    std::erase_if(chunks, [id](const auto& chunk) { return chunk.first == id; });
    return chunks;
}

struct Layout {
    const char* name;
    FourCC container;
    std::string order; // F format, D data, I item, o other chunk, f filler, J reservation
    bool isOpenEnded = false;
};

Bytes build(const Layout& layout)
{
    Chunks chunks;
    int number = 0;
    for (char kind : layout.order) {
        ++number;
        switch (kind) {
        case 'F':
            chunks.push_back(formatChunk(layout.container));
            break;
        case 'D':
            chunks.push_back(dataChunk(layout.container));
            break;
        case 'I':
            chunks.emplace_back(kItem, std::string(static_cast<std::size_t>(30 + number), 'I'));
            break;
        case 'o':
            chunks.emplace_back(fourCC("cue "), std::string(static_cast<std::size_t>(20 + number), 'o'));
            break;
        case 'f':
            chunks.emplace_back(fourCC("free"), std::string(150, 'f'));
            break;
        case 'J':
            chunks.emplace_back(fourCC("JUNK"), std::string(28, 'J'));
            break;
        }
    }
    Bytes bytes = buildContainer(layout.container, chunks);
    if (layout.isOpenEnded) // the size of "data", the last chunk, in CAF
        storeBE(bytes.data() + bytes.size() - chunks.back().second.size() - 8, std::int64_t{-1});
    return bytes;
}

struct Edit {
    std::string name;
    std::size_t index;
    int length; // -1 removes
    std::int32_t apply(AudioFile& file) const
    {
        const auto place = static_cast<std::uint32_t>(index);
        return length < 0 ? file.removeUserData(kItem, place)
                          : setItem(file, kItem, place, std::string(static_cast<std::size_t>(length), 'N'));
    }
    std::vector<std::string> applied(std::vector<std::string> items) const
    {
        if (length < 0)
            items.erase(items.begin() + static_cast<std::ptrdiff_t>(index));
        else if (index == items.size())
            items.emplace_back(static_cast<std::size_t>(length), 'N');
        else
            items[index] = std::string(static_cast<std::size_t>(length), 'N');
        return items;
    }
};

std::vector<Edit> editsOf(const std::vector<std::string>& items)
{
    std::vector<Edit> edits{{"append", items.size(), 41}, {"append much", items.size(), 5000}};
    for (std::size_t i = 0; i < items.size(); ++i) {
        const std::string number = " " + std::to_string(i);
        edits.push_back({"same length" + number, i, static_cast<int>(items[i].size())});
        edits.push_back({"shorter" + number, i, 7});
        edits.push_back({"longer" + number, i, 90});
        edits.push_back({"much longer" + number, i, 5000});
        edits.push_back({"empty" + number, i, 0});
        edits.push_back({"remove" + number, i, -1});
    }
    return edits;
}

} // namespace

class UserDataEdit : public testing::TestWithParam<Layout> {
protected:
    /// Opens, applies, closes; returns the status and the number of calls that changed the file.
    std::pair<std::int32_t, int> run(const Edit& edit, int failing, Fault fault)
    {
        std::filesystem::remove(folder / "file"); // some file systems flush a file that is written over
        folder.write("file", original);
        const FaultyDisk disk(failing, fault);
        const auto file = openAudio(folder / "file");
        const std::int32_t status = edit.apply(*file);
        return {status, FaultyDisk::calls};
    }

    /// Checks what must hold at every instant, and returns the items that a reader finds.
    std::vector<std::string> check()
    {
        const Bytes bytes = readFile(folder / "file");
        const Chunks chunks = walkContainer(bytes);
        EXPECT_EQ(without(chunks, kItem), without(walkContainer(original), kItem)) << "another chunk changed";
        const auto file = openAudio(folder / "file", false);
        std::string samples(testSamples.size() + 1, '\0');
        auto count = static_cast<std::uint32_t>(samples.size());
        EXPECT_TRUE(file != nullptr);
        EXPECT_EQ(file->readBytes(0, count, samples.data()), 0);
        EXPECT_EQ(samples.substr(0, count), testSamples);
        EXPECT_EQ(itemsOf(*file, kItem), bodiesOf(chunks, kItem)) << "the service reads otherwise";
        return bodiesOf(chunks, kItem);
    }

    /// Killed between the two steps: the items up to the old one, or one beyond it, and then all from the new one on.
    static bool isBetweenTheSteps(const std::vector<std::string>& found, const std::vector<std::string>& before,
                                  const std::vector<std::string>& after, std::size_t index)
    {
        for (std::size_t kept = index + 1; kept <= before.size(); ++kept) {
            std::vector<std::string> expected(before.begin(), before.begin() + static_cast<std::ptrdiff_t>(kept));
            expected.insert(expected.end(), after.begin() + static_cast<std::ptrdiff_t>(index), after.end());
            if (found == expected)
                return true;
        }
        return false;
    }

    void cutShortEverywhere(const Edit& edit)
    {
        const auto before = bodiesOf(walkContainer(original), kItem);
        const auto after = edit.applied(before);
        const auto [status, calls] = run(edit, 0, Fault::none);
        ASSERT_EQ(status, 0);
        EXPECT_EQ(check(), after);
        for (Fault fault : {Fault::once, Fault::onceAfterHalf, Fault::fromThereOn, Fault::fullAfterHalf}) {
            const bool isInPlace = edit.length >= 0 && edit.index < before.size() &&
                                   before[edit.index].size() == static_cast<std::size_t>(edit.length);
            for (int call = 0; call < calls; ++call) {
                if (isInPlace && fault == Fault::fullAfterHalf)
                    continue; // the bytes are on the disk already
                SCOPED_TRACE("fault " + std::to_string(static_cast<int>(fault)) + " at call " + std::to_string(call));
                const std::int32_t result = run(edit, call, fault).first;
                const auto found = check();
                const bool isBoth = result != 0 && (fault == Fault::fromThereOn || fault == Fault::fullAfterHalf) &&
                                    edit.length >= 0 && isBetweenTheSteps(found, before, after, edit.index);
                EXPECT_TRUE(isBoth || found == (result == 0 ? after : before)) << "status " << result;
                const FaultyDisk disk(0, Fault::none);
                const auto file = openAudio(folder / "file");
                ASSERT_EQ(setItem(*file, fourCC("next"), 0, "more"), 0) << "the file cannot be edited again";
                EXPECT_EQ(itemsOf(*file, kItem), found);
            }
        }
    }

    TemporaryFolder folder;
    Bytes original;
};

TEST_P(UserDataEdit, CutShortAtEachCallLeavesTheOldOrTheNewItem)
{
    original = build(GetParam());
    for (const Edit& edit : editsOf(bodiesOf(walkContainer(original), kItem))) {
        SCOPED_TRACE(edit.name);
        cutShortEverywhere(edit);
        if (HasFatalFailure())
            return;
    }
}

INSTANTIATE_TEST_SUITE_P(
    Containers, UserDataEdit,
    testing::Values(Layout{"WAVEItemsLast", fourCC("WAVE"), "FDoIoIo"}, Layout{"WAVEReserved", fourCC("WAVE"), "JFDIo"},
                    Layout{"WAVEItemsFirst", fourCC("WAVE"), "IFoIDoI"},
                    Layout{"WAVEFiller", fourCC("WAVE"), "FfoIffDIof"}, Layout{"RF64", fourCC("RF64"), "FIDoI"},
                    Layout{"AIFFItemsLast", fourCC("AIFF"), "FDoIIo"},
                    Layout{"AIFFItemsFirst", fourCC("AIFF"), "FIIoDo"},
                    Layout{"AIFFItemsAroundOthers", fourCC("AIFF"), "FIoIfIDIo"},
                    Layout{"CAFItemsLast", fourCC("caff"), "FDoIoIo"},
                    Layout{"CAFItemsFirst", fourCC("caff"), "FIoDoI"}, Layout{"CAFFiller", fourCC("caff"), "FfIoDofIf"},
                    Layout{"CAFOpenEnded", fourCC("caff"), "FID", true}),
    [](const auto& layout) { return layout.param.name; });

TEST(UserDataEdit, FilesDoNotGrowWithRepeatedEdits)
{
    for (FourCC container : {fourCC("WAVE"), fourCC("AIFF"), fourCC("caff")}) {
        SCOPED_TRACE(fourCCText(container));
        const FaultyDisk disk(0, Fault::none);
        TemporaryFolder folder;
        const std::string path = folder.write("file", build({"", container, "FIDIII"}));
        const auto file = openAudio(path);
        std::vector<std::string> items = itemsOf(*file, kItem);
        std::uintmax_t largest = 0;
        for (std::uint32_t i = 0; i < 400; ++i) {
            const std::uint32_t place = i % 4;
            const std::string body(200 + i * 37 % 101, static_cast<char>('a' + i % 26));
            if (i % 3 == 0) { // as those do who remove an item and append the new one
                ASSERT_EQ(file->removeUserData(kItem, place), 0);
                items.erase(items.begin() + place);
                ASSERT_EQ(setItem(*file, kItem, 3, body), 0);
                items.push_back(body);
            } else {
                ASSERT_EQ(setItem(*file, kItem, place, body), 0);
                items[place] = body;
            }
            ASSERT_EQ(itemsOf(*file, kItem), items) << "edit " << i;
            largest = std::max(largest, std::filesystem::file_size(path));
        }
        EXPECT_LT(largest, 4000u) << "4 items of at most 300 bytes";
        for (int i = 0; i < 4; ++i)
            ASSERT_EQ(file->removeUserData(kItem, 0), 0);
        EXPECT_LT(std::filesystem::file_size(path), 400u) << "filler at the end is cut off";
        walkContainer(readFile(path));
    }
}

TEST(UserDataEdit, ManyItemsAreRemovedInOnePass)
{
    constexpr std::uint32_t count = 8000;
    for (const FourCC container : {fourCC("WAVE"), fourCC("AIFF"), fourCC("caff")})
        for (const bool isApart : {false, true}) {
            SCOPED_TRACE(fourCCText(container) + (isApart ? ", apart" : ", in a row"));
            Chunks chunks{formatChunk(container), dataChunk(container)};
            for (std::uint32_t i = 0; i < count; ++i) {
                chunks.emplace_back(kItem, "item");
                if (isApart || i + 1 == count)
                    chunks.emplace_back(fourCC("cue "), "other");
            }
            TemporaryFolder folder;
            const std::string path = folder.write("file", buildContainer(container, chunks));
            const auto file = openAudio(path);
            std::vector<std::uint32_t> indices(count - 1);
            std::iota(indices.begin(), indices.end(), 1U);
            FaultInjector faults;
            EXPECT_EQ(file->removeUserData(kItem, indices), 0);
            EXPECT_LE(faults.calls(Call::pread) + faults.calls(Call::pwrite), 3 * static_cast<int>(count));
            EXPECT_EQ(itemsOf(*file, kItem).size(), 1U);
            EXPECT_EQ(without(walkContainer(readFile(path)), kItem), without(chunks, kItem));
        }
}

TEST(UserDataEdit, SeveralAreRemovedAsOneByOne)
{
    TemporaryFolder folder;
    for (const FourCC container : {fourCC("WAVE"), fourCC("AIFF"), fourCC("caff")})
        for (const char* order : {"FDIIII", "FIIDII", "FIfIDIoI", "FffIIfIoDIf"})
            for (std::uint32_t mask = 0; mask < 16; ++mask) {
                SCOPED_TRACE(fourCCText(container) + " " + order + " " + std::to_string(mask));
                const Bytes content = build({"", container, order});
                const auto together = openAudio(folder.write("together", content));
                const auto single = openAudio(folder.write("single", content));
                std::vector<std::uint32_t> indices;
                for (std::uint32_t index = 0; index < 4; ++index)
                    if ((mask >> index & 1) != 0)
                        indices.push_back(index);
                EXPECT_EQ(together->removeUserData(kItem, indices), 0);
                for (auto index = indices.rbegin(); index != indices.rend(); ++index)
                    EXPECT_EQ(single->removeUserData(kItem, *index), 0);
                EXPECT_EQ(walkContainer(readFile(folder / "together")), walkContainer(readFile(folder / "single")));
                EXPECT_EQ(itemsOf(*together, kItem), itemsOf(*single, kItem));
            }
    const auto file = openAudio(folder.write("file", build({"", fourCC("caff"), "FDIII"})));
    for (const std::vector<std::uint32_t>& wrong : {std::vector{1U, 1U}, {2U, 0U}, {0U, 3U}})
        EXPECT_EQ(file->removeUserData(kItem, wrong), kStatusParameterError);
    EXPECT_EQ(itemsOf(*file, kItem).size(), 3U);
}

TEST(UserDataEdit, BytesBehindTheContainer)
{
    TemporaryFolder folder;
    Bytes wave = build({"", fourCC("WAVE"), "FDI"});
    const Bytes clean = wave;
    wave.insert(wave.end(), 100, std::byte{'T'});
    auto file = openAudio(folder.write("tag", wave));
    ASSERT_EQ(setItem(*file, kItem, 0, std::string(33, 'i')), 0);
    EXPECT_EQ(readFile(folder / "tag").size(), wave.size()) << "an edit in place leaves them alone";
    ASSERT_EQ(file->removeUserData(kItem, 0), 0);
    EXPECT_EQ(readFile(folder / "tag").size(), wave.size());
    ASSERT_EQ(setItem(*file, kItem, 0, std::string(300, 'i')), 0); // needs their place
    EXPECT_EQ(walkContainer(readFile(folder / "tag")).size(), 3u);

    // A recording that was killed: its sizes were not filled in, and the apparent tail is its samples.
    wave = buildContainer(fourCC("WAVE"), {formatChunk(fourCC("WAVE")), {fourCC("data"), ""}});
    wave.insert(wave.end(), 1000, std::byte{'s'});
    file = openAudio(folder.write("killed", wave));
    EXPECT_EQ(setItem(*file, kItem, 0, "item"), kStatusIOError);
    EXPECT_EQ(readFile(folder / "killed"), wave);
}

TEST(UserDataEdit, StaleAndMissingSizesAreSettledBeforeAnythingFollows)
{
    TemporaryFolder folder;
    // "data" longer than the file, as in an interrupted download, and an odd last chunk without its pad byte.
    Bytes cut = build({"", fourCC("AIFF"), "FD"});
    cut.resize(cut.size() - 5);
    Bytes unpadded = build({"", fourCC("WAVE"), "FDo"}); // 23 bytes and the pad
    unpadded.pop_back();
    storeLE(unpadded.data() + 4, static_cast<std::uint32_t>(unpadded.size() - 8));
    for (const Bytes& bytes : {cut, unpadded}) {
        const auto file = openAudio(folder.write("file", bytes));
        ASSERT_EQ(setItem(*file, kItem, 0, "item"), 0);
        const Chunks chunks = walkContainer(readFile(folder / "file"));
        ASSERT_EQ(chunks.back(), Chunks::value_type(kItem, "item"));
        EXPECT_EQ(itemsOf(*file, kItem), std::vector<std::string>{"item"});
    }
}

TEST(UserDataEdit, ExtendingTheSamplesCutShortLeavesWhatWasThere)
{
    const std::string more = "MORE SAMPLES, 25 of them.."; // 13 frames
    for (FourCC container : {fourCC("WAVE"), fourCC("RF64"), fourCC("AIFF"), fourCC("caff")})
        for (Fault fault : {Fault::none, Fault::once, Fault::onceAfterHalf, Fault::fromThereOn, Fault::fullAfterHalf})
            for (int call = 0; call < (fault == Fault::none ? 1 : 5); ++call) {
                SCOPED_TRACE(fourCCText(container) + " fault " + std::to_string(static_cast<int>(fault)) + " at call " +
                             std::to_string(call));
                TemporaryFolder folder;
                const std::string path = folder.write("file", build({"", container, "FIoD"}));
                std::int32_t status = 0;
                {
                    const FaultyDisk disk(call, fault);
                    std::uint32_t packets = 13;
                    status = openAudio(path)->writePackets(8, packets, more.data());
                    EXPECT_EQ(packets, status == 0 ? 13u : 0u);
                }
                const auto file = openAudio(path);
                std::string samples(100, '\0');
                auto count = static_cast<std::uint32_t>(samples.size());
                ASSERT_EQ(file->readBytes(0, count, samples.data()), 0);
                EXPECT_EQ(samples.substr(0, count), (testSamples + more).substr(0, count));
                EXPECT_GE(count, testSamples.size());
                EXPECT_EQ(itemsOf(*file, kItem).size(), 1u);
                if (fault == Fault::none) {
                    EXPECT_EQ(status, 0);
                    EXPECT_EQ(count, 42u);
                    EXPECT_EQ(walkContainer(readFile(path)).size(), 4u);
                }
            }
}

// Two odd chunks without pad bytes become filler of odd size, and a zero after it would pass for its pad byte.
TEST(UserDataEdit, MissingPadsAheadOfAnIdThatBeginsWithZero)
{
    TemporaryFolder folder;
    Bytes bytes = buildContainer(fourCC("AIFF"), {formatChunk(fourCC("AIFF"))});
    const Bytes tail = buildContainer(fourCC("AIFF"), {{1, "even"}, dataChunk(fourCC("AIFF"))});
    std::string odd = std::string("note\0\0\0\7n", 9) + "nnnnnn" + std::string("uuid\0\0\0\0", 8);
    for (const char byte : odd)
        bytes.push_back(static_cast<std::byte>(byte));
    bytes.insert(bytes.end(), tail.begin() + 12, tail.end());
    storeBE(bytes.data() + 4, static_cast<std::uint32_t>(bytes.size() - 8));
    for (const bool isNoteFirst : {false, true}) {
        const std::string path = folder.write("file", bytes);
        const auto file = openAudio(path);
        ASSERT_EQ(file->removeUserData(isNoteFirst ? fourCC("note") : kItem, 0), 0);
        ASSERT_EQ(setItem(*file, isNoteFirst ? kItem : fourCC("note"), 0, std::string(50, 'x')), 0);
        std::string samples(16, '\0');
        std::uint32_t count = 16;
        EXPECT_EQ(openAudio(path, false)->readBytes(0, count, samples.data()), 0);
        EXPECT_EQ(samples, testSamples);
    }
}

// The "ds64" holds the size of the first "data". A correction of a second one once changed that of the first.
TEST(UserDataEdit, ASecondDataChunkHasASizeOfItsOwn)
{
    constexpr FourCC rf64 = fourCC("RF64");
    TemporaryFolder folder;
    Bytes bytes = buildContainer(rf64, {formatChunk(rf64), dataChunk(rf64), {fourCC("late"), "12345678"}});
    const auto late = static_cast<std::size_t>(bytes.size() - 16);
    storeBE(bytes.data() + late, fourCC("data"));
    storeLE(bytes.data() + late + 4, std::uint32_t{1000}); // beyond the end of the file
    const auto file = openAudio(folder.write("file", bytes));
    ASSERT_EQ(setItem(*file, kItem, 0, "item"), 0);
    std::uint64_t count = 0;
    EXPECT_EQ(file->audioDataByteCount(count), 0);
    EXPECT_EQ(count, testSamples.size());
    EXPECT_EQ(itemsOf(*file, kItem), std::vector<std::string>{"item"});
}

// An id of zeros with a size beyond the end would become all zeros when corrected, and hide whatever follows.
TEST(UserDataEdit, NothingIsPutBehindCAFSamplesThatAreNotThere)
{
    const FourCC caf = fourCC("caff");
    TemporaryFolder folder;
    const Bytes whole = buildContainer(caf, {formatChunk(caf), {fourCC("data"), ""}});
    for (const char last : {'\0', '\x75'}) { // of its size: never filled in, and cut short
        Bytes bytes = whole;
        bytes.back() = static_cast<std::byte>(last);
        const std::string path = folder.write("file", bytes);
        EXPECT_EQ(setItem(*openAudio(path), kItem, 0, "item"), kStatusIOError);
        EXPECT_EQ(readFile(path), bytes);
    }
}

TEST(UserDataEdit, NothingIsPutBehindAHeaderOfZerosThatEndsTheFile)
{
    for (const FourCC container : {fourCC("WAVE"), fourCC("AIFF"), fourCC("caff")}) {
        TemporaryFolder folder;
        const std::string path =
            folder.write("file", buildContainer(container, {formatChunk(container), dataChunk(container), {0, ""}}));
        Bytes bytes = readFile(path);
        bytes[bytes.size() - 2] = std::byte{0x10}; // of its size
        folder.write("file", bytes);
        EXPECT_EQ(setItem(*openAudio(path), kItem, 0, "item"), kStatusIOError) << fourCCText(container);
        EXPECT_EQ(itemsOf(*openAudio(path), kItem), std::vector<std::string>());
        EXPECT_EQ(readFile(path), bytes);
    }
}
