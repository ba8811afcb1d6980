// Changes to the chunks of a container, each proven by a look at what came of it. They are made to the file itself:
// inside CContainerEdit::Apply nothing can be lost by them.
#pragma once

#include "audiofile/ChunkSurvey.h"
#include "audiofile/ContainerProblem.h"
#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

/// Opens a file that takes chunks. Problems: status, empty, noContainer, onlyRead.
KT_EXPORT ContainerProblem OpenContainer(CAudioFileIO& file, const CFileRef& ref, unsigned int mode);

/// Removes every chunk of the id, which must be `count`. Problems: those of OpenContainer, chunks, notRemoved.
KT_EXPORT ContainerProblem RemoveChunksFrom(const CFileRef& container, FourCC id, std::int64_t count);

struct NewChunk {
    FourCC id = 0;
    BytesView body = {};
    bool replaces = false; // all that have its id
    bool isForced = false; // also where there is an objection
};
/// Puts the chunk behind the last one; a missing pad byte, stray bytes too few for a chunk, and an open-ended CAF
/// "data" are put right first. Problems: those of RemoveChunksFrom, adding, notFound, misplaced; and status,
/// kStatusParameterError, for what ObjectToAdding objects to, unless forced.
KT_EXPORT ContainerProblem AddChunkTo(const CFileRef& container, const NewChunk& chunk);

/// Gives a chunk "data" that goes to the end of a CAF file its size, and does what else PrepareToAppend does, so that
/// any writer may put a chunk behind the last one. Problems: those of OpenContainer, status.
KT_EXPORT ContainerProblem SettleContainerEnd(const CFileRef& container);
