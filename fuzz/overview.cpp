// Files of any bytes: the overview that is stored in them is read, one of their samples is made, stored and looked for
// again. Nothing else is asked of the last step: a damaged container may end up with other frames.
#include "loops/overview/StoredOverview.h"

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <string>

#include <unistd.h>

namespace {

void require(bool condition)
{
    if (!condition)
        __builtin_trap();
}

/// A file of this process, written anew for every input and removed at the end.
class ScratchFile {
public:
    ScratchFile()
        : path_(std::filesystem::temp_directory_path() / ("ktfiles-fuzz-overview-" + std::to_string(getpid())))
    {
    }
    ~ScratchFile() { std::filesystem::remove(path_); }
    ScratchFile(const ScratchFile&) = delete;
    ScratchFile& operator=(const ScratchFile&) = delete;

    CFileRef write(const std::uint8_t* data, std::size_t size) const
    {
        std::ofstream out(path_, std::ios::binary | std::ios::trunc);
        out.write(reinterpret_cast<const char*>(data), static_cast<std::streamsize>(size));
        return CFileRef(path_.c_str(), false);
    }

private:
    std::filesystem::path path_;
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static const ScratchFile file;
    const CFileRef ref = file.write(data, size);
    std::int32_t status = kStatusOK;
    const auto stored = ReadOverviewFromAudioFile(ref, 0, &status);
    require(stored == nullptr || (status == kStatusOK && IsOverviewBlock(*stored)));

    const auto created = CAudioFileIO(ref, 0).CreateOverview({}, &status);
    require((created != nullptr) == (status == kStatusOK));
    if (created == nullptr)
        return 0;
    require(IsOverviewBlock(*created) && created->size() <= kOverviewHeaderSize + 2 + size / 128);
    bool isStored = false;
    status = WriteOverviewToAudioFile(ref, created.get(), 0, &isStored);
    require(!isStored || status == kStatusOK);
    ReadOverviewFromAudioFile(ref, 0);
    return 0;
}
