#include "tool/shared/indexing/SoundColumns.h"

#include "tool/shared/description/FileDescription.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/library/LibraryRecord.h"
#include "tool/shared/output/Record.h"

void addSound(LibraryRecord& record, const AudioFileInfo& info)
{
    record.containerName = containerWord(info);
    record.fileType = fourCCText(info.fileType);
    record.coding = codingWord(info);
    record.sampleRate = positive(static_cast<double>(info.sampleRate));
    if (info.exactSampleRate > 0)
        record.durationSeconds = durationOf(info);
    record.bitsPerSample = positive(std::int64_t{info.bitsPerSample});
    record.sourceBits = positive(std::int64_t{info.sourceBits});
    if (!info.compressed)
        record.floatingPoint = info.floatingPoint ? 1 : 0;
    record.channels = info.channels;
    record.channelLayout = layoutWord(info);
    record.frames = info.frames;
    record.bitRate = positive(bitRateOf(info));
}
