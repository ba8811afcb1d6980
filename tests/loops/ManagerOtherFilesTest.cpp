// Loop chunks where they have no place: other kinds of files, and ids that mean nothing in CAF.
#include "LoopFiles.h"

#include "loops/VireoLoopGenericChunkData.h"
#include "loops/tagging/CAFPayloads.h"

TEST(LoopManagerElsewhere, SaysThatNothingWasDone)
{
    const TemporaryFolder folder;
    for (const char* type : {"WAVE", "AIFC"}) {
        const FourCC container = fourCC(type[0], type[1], type[2], type[3]);
        Bytes original = audioFile(container == fourCC("AIFC") ? kAIFF : container);
        if (container == fourCC("AIFC"))
            original[11] = std::byte{'C'};
        const std::string path = folder.write("file", original);
        EXPECT_FALSE(manage(path).removeChunks(VireoLoopChunks::Empty())) << type;
        VireoLoopChunkList list;
        list.push_back(std::make_unique<VireoLoopPatchChunk>());
        EXPECT_TRUE(manage(path).writeChunks(list)) << "of nothing, nothing is missing";
        list[0]->chunkData().setChunkData(bytesOf("patch"), kAIFF);
        EXPECT_FALSE(manage(path).writeChunks(list)) << type;
        EXPECT_EQ(readFile(path), original);
    }
}

TEST(LoopManagerElsewhere, AnIdWithoutUUIDIsNoOneElsesItem)
{
    const TemporaryFolder folder;
    const Bytes original = audioFile(kCAF, {{fourCC("uuid"), std::string(40, 'u')}, {fourCC("uuid"), "short"}});
    const std::string path = folder.write("file.caf", original);
    VireoLoopChunkList list;
    list.push_back(std::make_unique<VireoLoopBaseChunk>(fourCC("none")));
    manage(path).readChunks(list);
    EXPECT_TRUE(list[0]->chunkData().isEmpty());
    EXPECT_TRUE(manage(path).removeChunks(list));
    list[0]->chunkData().setChunkData(bytesOf("mine"), kCAF);
    EXPECT_FALSE(manage(path).writeChunks(list));
    EXPECT_EQ(readFile(path), original);
}

TEST(LoopManagerElsewhere, AFileThatSaysNothingOfItsOriginLeavesTheObjectAsItIs)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file.caf", audioFile(kCAF));
    VireoLoopChunkList list;
    auto info = std::make_unique<VireoLoopFileInfoChunk>();
    info->fileInfo().setDataDictionary({{VireoLoopFileInfoChunkDataTitleKey, std::string("title")}});
    list.push_back(std::move(info));
    manage(path).readChunks(list);
    EXPECT_EQ(tagsIn(list), (Tags{{"Title", "title"}}));
}

TEST(LoopManagerElsewhere, CountsBeyondAllMemoryGiveNothing)
{
    const std::int64_t position = 0;
    for (const std::int64_t count : {std::int64_t{1} << 32, std::int64_t{1} << 61, INT64_MAX})
        EXPECT_EQ(CAFTransientUUIDChunkData(&position, count), std::nullopt) << count;
    EXPECT_EQ(CAFTransientUUIDChunkData(nullptr, 1), std::nullopt);
    EXPECT_EQ(CAFTransientUUIDChunkData(nullptr, 0)->size(), 36u);
}

TEST(LoopManagerElsewhere, CommentsLoseTheWhiteSpaceOfEveryScript)
{
    const Bytes comment = VireoLoopFileInfoChunkDataTypes::commentDataFromAifCommentChunkStrings(
        "\xC2\xA0\xE3\x80\x80 a\xE2\x80\x89word \xE2\x80\xA8\xC2\x85\n");
    EXPECT_EQ(VireoLoopFileInfoChunkDataTypes::commentStringFromAifCommentChunkData(comment), "a\xE2\x80\x89word");
    // Bytes of other characters are not white space.
    const Bytes letters = VireoLoopFileInfoChunkDataTypes::commentDataFromAifCommentChunkStrings("\xC3\xA0\xC3\x85");
    EXPECT_EQ(VireoLoopFileInfoChunkDataTypes::commentStringFromAifCommentChunkData(letters), "\xC3\xA0\xC3\x85");
}
