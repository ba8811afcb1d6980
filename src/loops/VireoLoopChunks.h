// The kinds of loop chunks that the suite knows, one class each, and the list of all of them.
#pragma once

#include "loops/VireoLoopBaseChunk.h"
#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopFileInfoChunkData.h"
#include "loops/VireoLoopTransientChunkData.h"

#include <memory>
#include <vector>

/// Title, artist, copyright, comments. Its AIFF id is 0, and yet it is written in AIFF, as four text chunks.
class KT_EXPORT VireoLoopFileInfoChunk : public VireoLoopBaseChunk {
public:
    VireoLoopFileInfoChunk();
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
    VireoLoopCombinedTagsChunkData& tags() { return static_cast<VireoLoopCombinedTagsChunkData&>(chunkData()); }
    std::unique_ptr<ChunkReader> aifChunkReader(platform::AudioFile& file) override;
    std::unique_ptr<ChunkWriter> aifChunkWriter(platform::AudioFile& file) override;
    std::unique_ptr<ChunkRemover> aifChunkRemover(platform::AudioFile& file) override;
};

class KT_EXPORT VireoLoopTransientChunk : public VireoLoopBaseChunk {
public:
    VireoLoopTransientChunk();
    VireoLoopTransientChunkData& transients() { return static_cast<VireoLoopTransientChunkData&>(chunkData()); }
};

class KT_EXPORT VireoLoopChannelStrip0Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip0Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip0) {}
};

class KT_EXPORT VireoLoopChannelStrip1Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip1Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip1) {}
};

class KT_EXPORT VireoLoopChannelStrip2Chunk : public VireoLoopBaseChunk {
public:
    VireoLoopChannelStrip2Chunk() : VireoLoopBaseChunk(tagging::kChannelStrip2) {}
};

class KT_EXPORT VireoLoopPatchChunk : public VireoLoopBaseChunk {
public:
    VireoLoopPatchChunk() : VireoLoopBaseChunk(tagging::kPatch) {}
};

class KT_EXPORT VireoLoopGenInstChunk : public VireoLoopBaseChunk {
public:
    VireoLoopGenInstChunk() : VireoLoopBaseChunk(tagging::kGenerativeInstrument) {}
};

class KT_EXPORT VireoLoopEvSeqChunk : public VireoLoopBaseChunk {
public:
    VireoLoopEvSeqChunk() : VireoLoopBaseChunk(tagging::kEventSequence) {}
};

class KT_EXPORT VireoLoopAdditionalChunk : public VireoLoopBaseChunk {
public:
    VireoLoopAdditionalChunk() : VireoLoopBaseChunk(tagging::kAdditionalLoopData) {}
};

class KT_EXPORT VireoLoopStepSeqChunk : public VireoLoopBaseChunk {
public:
    VireoLoopStepSeqChunk() : VireoLoopBaseChunk(tagging::kStepSequencer) {}
};

/// A Standard MIDI File; in CAF the top-level chunk "midi".
class KT_EXPORT VireoLoopMidiFileChunk : public VireoLoopBaseChunk {
public:
    VireoLoopMidiFileChunk() : VireoLoopBaseChunk(tagging::kMIDIFile) {}
};

/// In CAF files only.
class KT_EXPORT VireoLoopSilenceChunk : public VireoLoopBaseChunk {
public:
    VireoLoopSilenceChunk() : VireoLoopBaseChunk(tagging::kSilence, tagging::kCAFUUIDChunk, &tagging::kSilenceUUID) {}
};

using VireoLoopChunkList = std::vector<std::unique_ptr<VireoLoopBaseChunk>>;

class KT_EXPORT VireoLoopChunks {
public:
    /// An empty chunk object of every class: file info, combined tagging, transient, channel strips 0 to 2, patch,
    /// generative instrument, event sequence, additional, step sequencer, MIDI file, silence.
    static VireoLoopChunkList Empty();
};
