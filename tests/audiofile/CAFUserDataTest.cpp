// The suite's chunks in CAF files: "uuid" user-data items on a handle of the audio-file service.
#include "audiofile/CAudioFileIO.h"

#include "support/ContainerBuilder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

/// A UUID of one letter.
std::string uuid(char letter)
{
    return std::string(16, letter);
}

const unsigned char* bytesOfUUID(const std::string& uuid)
{
    return reinterpret_cast<const unsigned char*>(uuid.data());
}

class CAFUserData : public testing::Test {
protected:
    /// Opens a file with an item for each letter, whose body is the same letter; for '.', an item too short for a UUID.
    void perform(std::string_view letters, const std::function<void(platform::AudioFile&)>& block)
    {
        ContainerBuilder builder("caff");
        builder.format().chunk("data", std::string(8, 0));
        for (const char letter : letters)
            builder.chunk("uuid", letter == '.' ? "short" : uuid(letter) + letter);
        const CFileRef ref(folder_.write("a.caf", builder.bytes()).c_str(), false);
        bool called = false;
        CAudioFileIO::PerformAudioFileOperations(ref, [&](platform::AudioFile& file) {
            called = true;
            block(file);
        });
        EXPECT_TRUE(called);
    }

    static std::string letters(platform::AudioFile& file)
    {
        std::string found;
        CAudioFileIO::ForAllUUIDChunksPerformBlock(
            file, [&](const unsigned char* id, void* data, unsigned int size, int index, bool*) {
                EXPECT_EQ(std::memcmp(id, data, 16), 0);
                EXPECT_GE(size, 17u);
                EXPECT_EQ(index, 0);
                found += static_cast<const char*>(data)[16];
            });
        return found;
    }

    TemporaryFolder folder_;
};

TEST_F(CAFUserData, RemoveHitsTheRightItemsButTheSecondOfTwoNeighboursStays)
{
    struct Case {
        const char *before, *after;
    };
    for (const Case& each : {Case{"abc", "ac"}, Case{"bacb", "ac"}, Case{"abbc", "abc"}, Case{"bbb", "b"},
                             Case{"ac", "ac"}, Case{".ab.", "a"}}) {
        SCOPED_TRACE(each.before);
        perform(each.before, [&](platform::AudioFile& file) {
            EXPECT_EQ(CAudioFileIO::RemoveCAFChunkFromUUIDChunk(file, bytesOfUUID(uuid('b'))), 0);
            EXPECT_EQ(letters(file), each.after);
        });
    }
}

TEST_F(CAFUserData, AddReplacesAndAppends)
{
    perform("abc", [&](platform::AudioFile& file) {
        const std::string item = uuid('b') + "new";
        EXPECT_EQ(CAudioFileIO::AddCAFChunkToUUIDChunk(file, bytesOfUUID(uuid('b')), 19, item.data()), 0);
        EXPECT_EQ(letters(file), "acn");
    });
    CAudioFileIO file(CFileRef((folder_ / "a.caf").c_str(), false), 0);
    EXPECT_EQ(file.Info().frames, 2); // four bytes of edit count, four of samples
}

TEST_F(CAFUserData, FLACIsRefused)
{
    using platform::String;
    EXPECT_TRUE(CAudioFileIO::IsSupportedFileType(String::fromUTF8("audio/x-wav")));
    EXPECT_FALSE(CAudioFileIO::IsSupportedFileType(String::fromUTF8("audio/flac")));
    EXPECT_FALSE(CAudioFileIO::IsSupportedFileType(platform::ContentType::flac()));
}

} // namespace
