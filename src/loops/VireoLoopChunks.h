// The kinds of loop chunks that the suite knows, one class each, and the list of all.
#pragma once

#include "loops/VireoLoopBaseChunk.h"
#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopFileInfoChunkData.h"
#include "loops/VireoLoopTransientChunkData.h"

#include <memory>
#include <vector>

/// Title, artist, copyright, comments. Its AIFF id is 0; in AIFF it is four text chunks.
class KT_EXPORT VireoLoopFileInfoChunk : public VireoLoopBaseChunk {
public:
    VireoLoopFileInfoChunk();
    /// The content.
    VireoLoopFileInfoChunkData& fileInfo() { return static_cast<VireoLoopFileInfoChunkData&>(chunkData()); }
    std::unique_ptr<ChunkReader> cafChunkReader(platform::AudioFile& file) override;
    std::unique_ptr<ChunkReader> aifChunkReader(platform::AudioFile& file) override;
    std::unique_ptr<ChunkWriter> cafChunkWriter(platform::AudioFile& file) override;
    std::unique_ptr<ChunkWriter> aifChunkWriter(platform::AudioFile& file) override;
    std::unique_ptr<ChunkRemover> cafChunkRemover(platform::AudioFile& file) override;
    std::unique_ptr<ChunkRemover> aifChunkRemover(platform::AudioFile& file) override;
};

/// Beats, key, signature, category, genre, descriptors.
class KT_EXPORT VireoLoopCombinedTaggingChunk : public VireoLoopBaseChunk {
public:
    VireoLoopCombinedTaggingChunk();
    /// The content.
    VireoLoopCombinedTagsChunkData& tags() { return static_cast<VireoLoopCombinedTagsChunkData&>(chunkData()); }
    std::unique_ptr<ChunkReader> aifChunkReader(platform::AudioFile& file) override;
    std::unique_ptr<ChunkWriter> aifChunkWriter(platform::AudioFile& file) override;
    std::unique_ptr<ChunkRemover> aifChunkRemover(platform::AudioFile& file) override;
};

/// Frames at which the events of the loop begin.
class KT_EXPORT VireoLoopTransientChunk : public VireoLoopBaseChunk {
public:
    VireoLoopTransientChunk();
    /// The content.
    VireoLoopTransientChunkData& transients() { return static_cast<VireoLoopTransientChunkData&>(chunkData()); }
};

/// "CHST", settings of the first channel strip, not interpreted.
class KT_EXPORT VireoLoopChannelStrip0Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip0Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip0) {}
};

/// "CHSU", settings of the second channel strip, not interpreted.
class KT_EXPORT VireoLoopChannelStrip1Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip1Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip1) {}
};

/// "CHSV", settings of the third channel strip, not interpreted.
class KT_EXPORT VireoLoopChannelStrip2Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip2Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip2) {}
};

/// "PTCH", an instrument's settings, not interpreted.
class KT_EXPORT VireoLoopPatchChunk : public VireoLoopBaseChunk {
public:
    VireoLoopPatchChunk() : VireoLoopBaseChunk(tagging::kPatch) {}
};

/// "genI", a generative instrument, not interpreted.
class KT_EXPORT VireoLoopGenInstChunk : public VireoLoopBaseChunk {
public:
    VireoLoopGenInstChunk() : VireoLoopBaseChunk(tagging::kGenerativeInstrument) {}
};

/// "Sequ", recorded events, not interpreted.
class KT_EXPORT VireoLoopEvSeqChunk : public VireoLoopBaseChunk {
public:
    VireoLoopEvSeqChunk() : VireoLoopBaseChunk(tagging::kEventSequence) {}
};

/// "adLD", additional loop data, not interpreted.
class KT_EXPORT VireoLoopAdditionalChunk : public VireoLoopBaseChunk {
public:
    VireoLoopAdditionalChunk() : VireoLoopBaseChunk(tagging::kAdditionalLoopData) {}
};

/// "StSq", a step sequence, not interpreted.
class KT_EXPORT VireoLoopStepSeqChunk : public VireoLoopBaseChunk {
public:
    VireoLoopStepSeqChunk() : VireoLoopBaseChunk(tagging::kStepSequencer) {}
};

/// A Standard MIDI File, not interpreted; in CAF the top-level chunk "midi".
class KT_EXPORT VireoLoopMidiFileChunk : public VireoLoopBaseChunk {
public:
    VireoLoopMidiFileChunk() : VireoLoopBaseChunk(tagging::kMIDIFile) {}
};

/// Silence, in CAF files only; not interpreted.
class KT_EXPORT VireoLoopSilenceChunk : public VireoLoopBaseChunk {
public:
    VireoLoopSilenceChunk() : VireoLoopBaseChunk(tagging::kSilence, tagging::kCAFUUIDChunk, &tagging::kSilenceUUID) {}
};

/// Chunk objects and their owners.
using VireoLoopChunkList = std::vector<std::unique_ptr<VireoLoopBaseChunk>>;

/// The list of all kinds.
class KT_EXPORT VireoLoopChunks {
public:
    /// An empty chunk object of every class: file info, combined tagging, transient, channel strips 0 to 2, patch,
    /// generative instrument, event sequence, additional, step sequencer, MIDI file, silence.
    static VireoLoopChunkList Empty();
};
