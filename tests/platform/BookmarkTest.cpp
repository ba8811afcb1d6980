#include "platform/Bookmark.h"
#include "platform/FileSystem.h"
#include "platform/posix/ItemSearch.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <cerrno>

namespace fs = std::filesystem;
using namespace platform;

namespace {

class BookmarkTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        fs::create_directories(folder / "songs/one/loops");
        fs::create_directories(folder / "songs/two/loops/drums");
        file = folder.write("songs/one/loops/beat.wav", "beat");
        const auto made = makeBookmark(*urlOf(file), {});
        ASSERT_TRUE(made);
        bookmark = *made;
    }

    void expectFoundAt(const std::string& path, bool isStale) const
    {
        Error error;
        const ResolvedBookmark resolved = resolveBookmark(bookmark, {}, &error);
        EXPECT_EQ(pathOf(resolved.url), path) << error.description;
        EXPECT_EQ(resolved.isStale, isStale);
    }

    TemporaryFolder folder;
    std::string file;
    Bytes bookmark;
};

} // namespace

TEST_F(BookmarkTest, FindsTheFileAfterARenameOrAMoveNearby)
{
    for (const char* name : {"songs/one/loops/groove.wav", "songs/one/beat.wav", "songs/one/loops2/x/beat.wav"}) {
        fs::create_directories(fs::path(folder / name).parent_path());
        fs::rename(file, folder / name);
        expectFoundAt(folder / name, true);
        fs::rename(folder / name, file);
    }
    fs::rename(folder / "songs/one/loops", folder / "songs/one/renamed"); // with the folder that it lies in
    expectFoundAt(folder / "songs/one/renamed/beat.wav", true);
}

TEST_F(BookmarkTest, ASafelySavedFileWinsOverTheOldOneElsewhere)
{
    fs::rename(file, folder / "songs/one/loops/backup.wav");
    folder.write("songs/one/loops/beat.wav", "a new take");
    expectFoundAt(file, true);
}

TEST_F(BookmarkTest, AnInodeUsedAgainIsNotTakenForTheFile)
{
    // The bookmark of a deleted file whose inode number another file has now; birth time and handle differ.
    const std::string other = folder.write("songs/one/loops/other.wav", "another file");
    const Bytes ofOther = makeBookmark(*urlOf(other), {}).value();
    std::copy_n(ofOther.begin() + 16, 8, bookmark.begin() + 16);
    fs::remove(file);
    expectFoundAt("(null)", false);
}

TEST_F(BookmarkTest, TheSearchIsBoundedInEntries)
{
    const ItemIdentity item = itemIdentity(file.c_str()).value();
    folder.write("songs/one/a", "");
    folder.write("songs/one/b", ""); // with "loops" three entries; the file is the fourth
    EXPECT_EQ(findItem(item, {folder / "songs/one"}, SearchDepth::withSubfolders, 3), std::nullopt);
    EXPECT_EQ(findItem(item, {folder / "songs/one"}, SearchDepth::withSubfolders, 4), file);
    EXPECT_EQ(findItem(item, {folder / "songs/one"}, SearchDepth::folderOnly, 100), std::nullopt);
}

TEST_F(BookmarkTest, DamagedBytesAreRefusedAndNeverHarm)
{
    const std::size_t handleSize = std::to_integer<std::size_t>(bookmark[41]);
    const auto refused = [](Bytes bytes) {
        return !resolveBookmark(bytes, {}).url && bookmarkResources(bytes).path.isNull();
    };
    for (std::size_t size = 0; size < bookmark.size(); ++size)
        EXPECT_TRUE(refused(Bytes(bookmark.begin(), bookmark.begin() + static_cast<std::ptrdiff_t>(size)))) << size;
    Bytes longer = bookmark;
    longer.push_back({});
    EXPECT_TRUE(refused(longer));

    const std::pair<std::size_t, int> damages[] = {{0, 'K'},
                                                   {5, 2},
                                                   {40, 0xFF},
                                                   {41, 129},
                                                   {42, 0xFF},
                                                   {43, 0},
                                                   {44 + handleSize, 'a'},
                                                   {46 + handleSize, 0},
                                                   {46 + handleSize, 0xFF}};
    for (const auto& [offset, value] : damages) {
        Bytes damaged = bookmark;
        damaged[offset] = std::byte(value);
        EXPECT_TRUE(refused(damaged)) << offset;
    }
    // With any single bit changed, resolving does no harm.
    for (std::size_t bit = 0; bit < bookmark.size() * 8; ++bit) {
        Bytes damaged = bookmark;
        damaged[bit / 8] ^= std::byte(1 << bit % 8);
        bookmarkResources(damaged);
    }
}

TEST_F(BookmarkTest, TheFormatIsTheDocumentedOne)
{
    const std::size_t handleSize = std::to_integer<std::size_t>(bookmark[41]);
    EXPECT_EQ(textOf(bookmark).substr(0, 8), std::string_view("ktbm\0\1\0\0", 8));
    EXPECT_EQ(textOf(bookmark).substr(44 + handleSize), file);
    std::uint64_t inode = 0;
    for (std::size_t i = 16; i < 24; ++i)
        inode = inode << 8 | std::to_integer<std::uint64_t>(bookmark[i]);
    FileStatus status;
    ASSERT_TRUE(systemCalls().linkStatus(file.c_str(), &status));
    EXPECT_EQ(inode, status.inode);
}

TEST_F(BookmarkTest, AliasFilesAreToldByTheirContent)
{
    const std::string alias = folder.write("alias", bookmark);
    EXPECT_EQ(bookmarkOfAliasFile(*urlOf(alias)), bookmark);
    EXPECT_FALSE(isAliasFile(*urlOf(file)));
    EXPECT_FALSE(isAliasFile(*urlOf(folder.write("large", "ktbm\0\1" + std::string(10000, '\0')))));
    EXPECT_FALSE(isAliasFile(*urlOf(folder / "songs", true)));
    EXPECT_FALSE(isAliasFile(*urlOf(folder / "missing")));
    fs::create_symlink(alias, folder / "link");
    EXPECT_FALSE(isAliasFile(*urlOf(folder / "link")));
}
