#include "audiofile/EditScope.h"

#include "loops/tagging/ChunkIDs.h"

EditScope EditScope::ofLoopTags()
{
    using namespace tagging;
    return {Kind::chunks,
            {kBasicTagging,  kCategories,    kTransients,           kChannelStrip0, kChannelStrip1,
             kChannelStrip2, kPatch,         kGenerativeInstrument, kEventSequence, kAdditionalLoopData,
             kStepSequencer, kMIDIFile,      kCAFMIDIChunk,         fourCC("NAME"), fourCC("AUTH"),
             fourCC("(c) "), fourCC("COMT"), fourCC("info"),        fourCC("acid"), fourCC("smpl")},
            true};
}
