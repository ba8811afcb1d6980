// Shows the tags of a loop, or gives it another genre by a safe edit. Usage: loop_tags FILE [GENRE]
#include "audiofile/CContainerEdit.h"
#include "loops/VireoLoopChunks.h"
#include "loops/VireoLoopChunksManager.h"
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopTerms.h"
#include "platform/core/Status.h"

#include <cstdio>
#include <filesystem>

using Types = VireoLoopCombinedTagsChunkDataTypes;

int main(int argc, char** argv)
{
    if (argc != 2 && argc != 3)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]);
    const auto url = platform::URL::createWithFileSystemBytes(path, false);
    VireoLoopChunkList chunks = VireoLoopChunks::Empty();
    auto& tags = static_cast<VireoLoopCombinedTaggingChunk&>(*chunks[1]).tags(); // the second of the list

    VireoLoopChunksManager loop(url, platform::AudioFile::Permission::read);
    loop.readChunks(chunks);
    if (loop.status() != kStatusOK || tags.isEmpty()) {
        std::fprintf(stderr, "%s: %s\n", argv[1], loop.status() != kStatusOK ? StatusText(loop.status()) : "no loop");
        return 1;
    }
    platform::Dictionary dictionary = tags.dataDictionary();
    if (argc == 3) {
        dictionary[VireoLoopCombinedTagsChunkDataGenreKey] = argv[2];
        tags.setDataDictionary(dictionary);
        const auto write = [&](const std::string& copy) -> std::int32_t {
            VireoLoopChunksManager changed(platform::URL::createWithFileSystemBytes(copy, false));
            return changed.writeChunks({&chunks[1], 1}) ? kStatusOK : kStatusIOError;
        };
        CContainerEdit edit;
        FileProblem problem = edit.Begin(path);
        if (!problem)
            problem = edit.Apply(EditScope::ofLoopTags(), write);
        if (problem) {
            std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(problem.Status()));
            return 1;
        }
    }
    const auto number = [&](const char* key) { return Types::numberFor(dictionary, key); };
    const auto* genre = platform::find<std::string>(dictionary, VireoLoopCombinedTagsChunkDataGenreKey);
    std::printf("%s: %lld beats, key %s %s, genre %s\n", argv[1],
                static_cast<long long>(number(VireoLoopCombinedTagsChunkDataBeatCountKey)),
                VireoLoopNoteName(number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey)).data(),
                VireoLoopModeName(number(VireoLoopCombinedTagsChunkDataKeyType)).data(),
                genre != nullptr ? genre->c_str() : "unknown");
    return 0;
}
