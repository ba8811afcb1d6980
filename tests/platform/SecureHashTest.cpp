#include "platform/SecureHash.h"
#include "platform/FileCoordination.h"
#include "support/Hex.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

namespace {

using namespace platform;

// The key of a lock: if it changed, processes with another version of the library would no longer meet.
TEST(SecureHash, ThePathsBytesAreTheKey)
{
    const struct {
        std::string path;
        const char* digest; // of the UTF-8, as other programs compute it
    } cases[] = {
        {"/", "8a5edab282632443219e051e4ade2d1d5bbc671c781051bf1437897cbdfea0f1"},
        {"/" + std::string(999, 'a'), "f2d5f1a046752a83ef832b8c14bb5b4a7624110a56dfac4d29de77178fcabed3"},
        {"/Volumes/Lieder/Fröhlich.wav", "ce336ab1f1cccec9da53dfe3f021a0ec368cdc94db420d2f9272c5932acccd50"},
    };
    for (const auto& each : cases) {
        const auto digest = fileSystemRepresentationSHA256(String::fromUTF8(each.path));
        ASSERT_TRUE(digest) << each.path;
        EXPECT_EQ(toHex(*digest), each.digest) << each.path;
        EXPECT_EQ(CoordinatedItem(urlOf(each.path)).key(), *digest) << each.path;
    }
    EXPECT_FALSE(fileSystemRepresentationSHA256(String()));
    EXPECT_FALSE(fileSystemRepresentationSHA256(String::fromUTF8(std::string_view("/a\0b", 4))));
    EXPECT_TRUE(fileSystemRepresentationSHA256(String::fromUTF8("")));
}

} // namespace
