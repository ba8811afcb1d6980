#include "tool/shared/looptags/LoopTagsCsv.h"

namespace {

constexpr const char* kColumns[] = {
    "path",         "fileType",        "containerName", "sampleRate",   "frames",         "durationSeconds",
    "tempo",        "beatCount",       "midiRootNote",  "key",          "keyType",        "mode",
    "signatureTop", "signatureBottom", "signature",     "loopFileType", "instrumentType", "instrumentSubType",
    "genre",        "descriptors",     "title",         "artist",       "copyright",      "comments",
    "sources",      "loops",           "markers",       "transients",   "chunks",         "error"};

} // namespace

CsvColumns loopColumns()
{
    return kColumns;
}

std::string loopRow(const std::string& path, const LoopTags& tags)
{
    Record record;
    record.member("path", path);
    for (const LoopTagValue& tag : loopTagRecord(tags))
        record.member(tag.name, tag.value);
    platform::Array sources, loops, ids;
    for (const auto& [name, chunk] : loopTagSources(tags))
        sources.emplace_back(fmt::format("{}={}", name, chunk));
    for (const auto& loop : tags.sampler.loops)
        loops.emplace_back(fmt::format("{}-{}", loop.firstFrame, loop.lastFrame));
    for (const LoopTags::Chunk& chunk : tags.chunks)
        ids.emplace_back(chunk.id);
    record.member("sources", sources).member("loops", loops).member("markers", tags.sampler.markers.size());
    return csvRow(kColumns, record.member("transients", tags.transients.size()).member("chunks", ids));
}
