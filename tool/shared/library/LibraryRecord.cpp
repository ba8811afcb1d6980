#include "tool/shared/library/LibraryRecord.h"

std::span<const LibraryColumn> libraryColumns()
{
    using R = LibraryRecord;
    static constexpr LibraryColumn kColumns[] = {
        {"state", "state", &R::state},
        {"kind", "kind", &R::kind},
        {"container_name", "containerName", &R::containerName},
        {"file_type", "fileType", &R::fileType},
        {"coding", "coding", &R::coding},
        {"sample_rate", "sampleRate", &R::sampleRate},
        {"bits_per_sample", "bitsPerSample", &R::bitsPerSample},
        {"source_bits", "sourceBits", &R::sourceBits},
        {"floating_point", "floatingPoint", &R::floatingPoint},
        {"channels", "channels", &R::channels},
        {"channel_layout", "channelLayout", &R::channelLayout},
        {"frames", "frames", &R::frames},
        {"duration_seconds", "durationSeconds", &R::durationSeconds},
        {"bit_rate", "bitRate", &R::bitRate},
        {"tempo", "tempo", &R::tempo},
        {"tempo_source", "tempoSource", &R::tempoSource},
        {"beat_count", "beatCount", &R::beatCount},
        {"key_note", "keyNote", &R::keyNote},
        {"mode", "mode", &R::mode},
        {"key", "key", &R::key},
        {"key_source", "keySource", &R::keySource},
        {"signature", "signature", &R::signature},
        {"category", "category", &R::category},
        {"sub_category", "subCategory", &R::subCategory},
        {"genre", "genre", &R::genre},
        {"descriptors", "descriptors", &R::descriptors},
        {"title", "title", &R::title},
        {"artist", "artist", &R::artist},
        {"album", "album", &R::album},
        {"comment", "comment", &R::comment},
        {"recorded", "recorded", &R::recorded},
        {"sound_hash", "soundHash", &R::soundHash},
    };
    return kColumns;
}
