#include "audiofile/AudioFileCheck.h"

#include "audiofile/AudioDigest.h"
#include "audiofile/CAudioFileIO.h"
#include "audiofile/FileWindow.h"

#include <algorithm>
#include <array>

std::int32_t CheckAudioFile(CFileIO& file, std::vector<platform::ContainerFinding>& findings)
{
    FileWindow window(file, file.GetEOF());
    return platform::checkContainer(window, findings);
}

std::int32_t CheckStatedDigest(CAudioFileIO& file, std::vector<platform::ContainerFinding>& findings,
                               const std::function<bool()>& goesOn)
{
    using platform::ContainerFinding;
    constexpr FourCC id = fourCC("MD5 ");
    std::array<std::byte, 16> stated;
    const AudioFileInfo& info = file.Info();
    ChunkEntry chunk;
    if (info.fileType != kWAVE || info.missingDataSize > 0)
        return kStatusOK;
    if (const std::int32_t found = file.LocateChunk(id, chunk); found != 1)
        return found;
    ContainerFinding finding{
        .kind = ContainerFinding::Kind::digestIsWrong, .chunk = id, .offset = static_cast<std::uint64_t>(chunk.offset)};
    if (chunk.size != std::ssize(stated)) {
        finding.found = static_cast<std::uint64_t>(chunk.size);
        findings.push_back(finding);
        return kStatusOK;
    }
    if (const std::int32_t status = file.Read(stated.data(), chunk.body, std::ssize(stated), nullptr);
        status != kStatusOK)
        return status == kStatusEndOfFile ? kStatusOK : status; // the cut has been reported already
    platform::Digest digest(platform::Digest::Kind::md5);
    platform::Digest* const digests[] = {&digest};
    if (info.dataSize > 0)
        if (const std::int32_t status = DigestAudio(file, info, digests, goesOn); status != kStatusOK)
            return status;
    const Bytes found = digest.finish();
    if (std::ranges::equal(stated, found) || std::equal(stated.begin(), stated.end(), found.rbegin()))
        return kStatusOK;
    finding.kind = ContainerFinding::Kind::digestDiffers;
    findings.push_back(finding);
    return kStatusOK;
}
