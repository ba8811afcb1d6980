// Deleting, sizes, and unused names.
#include "files/CFileUtil.h"
#include "files/CFileUtilUniqueName.h"
#include "platform/core/Status.h"

#include "support/FaultInjection.h"
#include "support/References.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <set>
#include <thread>

namespace fs = std::filesystem;
using platform::String;

TEST(CFileUtil, DeletesFilesAndLinksOnly)
{
    const TemporaryFolder folder;
    folder.write("file", "12345");
    fs::create_symlink("file", folder / "link");
    fs::create_symlink("nowhere", folder / "dangling");
    fs::create_directory(folder / "folder");
    EXPECT_EQ(CFileUtilFileSize(file(folder / "link")), 5);
    EXPECT_EQ(CFileUtilDelete(file(folder / "link")), kStatusOK);
    EXPECT_EQ(CFileUtilFileSize(file(folder / "file")), 5); // the link's target is still there
    EXPECT_EQ(CFileUtilDelete(file(folder / "dangling")), kStatusOK);
    EXPECT_EQ(CFileUtilDelete(file(folder / "folder")), kStatusParameterError);
    EXPECT_TRUE(fs::exists(folder / "folder"));
    EXPECT_EQ(CFileUtilDelete(file(folder / "missing")), kStatusFileNotFound);
    EXPECT_EQ(CFileUtilDelete(CFileRef::None), kStatusParameterError);
}

TEST(UniqueName, IsTheFirstAtWhichNothingIs)
{
    const TemporaryFolder folder;
    const auto unique = [&](const std::string& name, const char* separator = " ") {
        return fs::path(CFileUtilCreateUniqueFileName(text(folder / name), text(separator)).utf8()).filename().string();
    };
    EXPECT_EQ(unique("Take.aif"), "Take.aif");
    const String free = text(folder / "/Take.aif");
    EXPECT_EQ(CFileUtilCreateUniqueFileName(free, text(" ")), free); // the very path
    folder.write("Take.aif", "");
    EXPECT_EQ(unique("Take.aif"), "Take 1.aif");
    folder.write("Take 1.aif", "");
    fs::create_symlink("nowhere", folder / "Take 2.aif"); // taken: a file could not be created there
    EXPECT_EQ(unique("Take.aif"), "Take 3.aif");
    EXPECT_EQ(unique("Take.aif", ""), "Take1.aif");
    fs::create_directory(folder / "Song");
    EXPECT_EQ(unique("Song"), "Song 1");
    EXPECT_EQ(unique("Song/"), "Song 1");
    for (const auto& [taken, next] : {std::pair{".hidden", ".hidden-1"}, {"Take.", "Take.-1"}, {"a.b.c", "a.b-1.c"}}) {
        folder.write(taken, "");
        EXPECT_EQ(unique(taken, "-"), next);
    }
    EXPECT_TRUE(CFileUtilCreateUniqueFileName(nullptr, text(" ")).isNull());
    EXPECT_TRUE(CFileUtilCreateUniqueFileName(text(""), text(" ")).isNull());
}

TEST(UniqueName, ThatIsCreatedGoesToOneCaller)
{
    const TemporaryFolder folder;
    constexpr int perThread = 50;
    std::vector<std::vector<std::string>> made(4);
    std::vector<std::thread> threads;
    for (auto& names : made)
        threads.emplace_back([&] {
            for (int i = 0; i < perThread; ++i) {
                String created;
                ASSERT_EQ(CFileUtilCreateUniqueFile(text(folder / "Take.aif"), text(" "), 0640, &created), kStatusOK);
                names.push_back(created.utf8());
            }
        });
    for (std::thread& thread : threads)
        thread.join();
    std::set<std::string> all;
    for (const auto& names : made)
        all.insert(names.begin(), names.end());
    EXPECT_EQ(all.size(), made.size() * perThread);
    EXPECT_TRUE(all.contains(folder / "Take.aif") && all.contains(folder / "Take 199.aif"));
    EXPECT_EQ(fs::status(folder / "Take 1.aif").permissions() & fs::perms::others_all, fs::perms::none);

    String created = text("before");
    EXPECT_EQ(CFileUtilCreateUniqueFile(text(folder / "missing/Take.aif"), text(" "), 0644, &created),
              kStatusFileNotFound);
    EXPECT_TRUE(created.isNull());
    EXPECT_EQ(CFileUtilCreateUniqueFile(text("relative"), text(" "), 0644, nullptr), kStatusParameterError);
    EXPECT_EQ(CFileUtilCreateUniqueFile(nullptr, text(" "), 0644, nullptr), kStatusParameterError);
}
