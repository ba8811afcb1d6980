#include "platform/SystemCalls.h"

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;
using platform::FileKind;
using platform::FileStatus;
using platform::OpenFor;
using platform::systemCalls;

TEST(SystemCalls, OpenTellsRegularFilesFromTheRest)
{
    const TemporaryFolder folder;
    const std::string file = folder.write("file", "12345");
    fs::create_symlink("file", folder / "link");
    fs::create_directory(folder / "folder");
    fs::create_directory_symlink("folder", folder / "folder link");
    folder.write("folder/inner", "1");
    ASSERT_EQ(mkfifo((folder / "fifo").c_str(), 0600), 0);

    const struct {
        std::string path;
        int open, openWithoutLinks; // 0, or the error number
    } cases[] = {
        {file, 0, 0},
        {folder / "link", 0, ELOOP},
        {folder / "folder link/inner", 0, ELOOP},
        {folder / "folder", EISDIR, EISDIR},
        {folder / "fifo", ENXIO, ENXIO},
        {"/dev/null", ENXIO, ENXIO},
        {folder / "none", ENOENT, ENOENT},
        {file + "/x", ENOTDIR, ENOTDIR},
    };
    const int before = open("/dev/null", O_RDONLY);
    for (const auto& c : cases) {
        for (const OpenFor access : {OpenFor::reading, OpenFor::readingAndWriting}) {
            for (const bool withoutLinks : {false, true}) {
                SCOPED_TRACE(c.path + (withoutLinks ? " without links" : ""));
                const auto call = withoutLinks ? systemCalls().openFileWithoutLinks : systemCalls().openFile;
                const int expected = withoutLinks ? c.openWithoutLinks : c.open;
                FileStatus status;
                const int descriptor = call(c.path.c_str(), access, &status);
                EXPECT_EQ(descriptor < 0 ? errno : 0, expected);
                if (descriptor < 0)
                    continue;
                EXPECT_EQ(status.kind, FileKind::file);
                EXPECT_EQ(fcntl(descriptor, F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
                EXPECT_EQ(fcntl(descriptor, F_GETFL) & O_ACCMODE, access == OpenFor::reading ? O_RDONLY : O_RDWR);
                EXPECT_EQ(systemCalls().close(descriptor), 0);
            }
        }
    }
    const int after = open("/dev/null", O_RDONLY);
    EXPECT_EQ(after, before + 1); // no refusal kept a descriptor
    close(before);
    close(after);
}

TEST(SystemCalls, StatusAndSpace)
{
    const TemporaryFolder folder;
    const std::string path = folder / "new";
    const int descriptor = systemCalls().createFile(path.c_str(), 0600);
    ASSERT_GE(descriptor, 0);
    EXPECT_EQ(systemCalls().createFile(path.c_str(), 0600), -1);
    EXPECT_EQ(errno, EEXIST);
    ASSERT_EQ(systemCalls().preallocate(descriptor, 0, 1 << 20), 0);
    struct stat allocated = {};
    ASSERT_EQ(fstat(descriptor, &allocated), 0);
    EXPECT_EQ(allocated.st_size, 0); // the space is there, the length unchanged
    EXPECT_GE(allocated.st_blocks * 512, 1 << 20);
    ASSERT_EQ(systemCalls().pwrite(descriptor, "abc", 3, 0), 3);

    fs::create_symlink("new", folder / "link");
    FileStatus byDescriptor, byPath, byLink;
    ASSERT_TRUE(systemCalls().status(descriptor, &byDescriptor));
    ASSERT_TRUE(systemCalls().pathStatus((folder / "link").c_str(), &byPath));
    ASSERT_TRUE(systemCalls().linkStatus((folder / "link").c_str(), &byLink));
    EXPECT_EQ(byDescriptor.size, 3);
    EXPECT_EQ(byDescriptor.permissions, 0600u);
    EXPECT_EQ(byPath.inode, byDescriptor.inode);
    EXPECT_EQ(byPath.device, byDescriptor.device);
    EXPECT_EQ(byLink.kind, FileKind::symbolicLink);
    EXPECT_EQ(systemCalls().close(descriptor), 0);
    EXPECT_EQ(systemCalls().adviseNoReuse(-1), -1);
}
