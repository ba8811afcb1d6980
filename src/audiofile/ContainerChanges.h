// Changes to the chunks of a container, each checked afterwards. They are made to the file itself; inside
// CContainerEdit::Apply they cannot lose anything.
#pragma once

#include "audiofile/ChunkSurvey.h"
#include "audiofile/ContainerProblem.h"
#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

/// Opens a file to which chunks can be added. Problems: status, empty, noContainer, onlyRead.
KT_EXPORT ContainerProblem OpenContainer(CAudioFileIO& file, const CFileRef& ref, unsigned int mode);

/// Removes every chunk of the id, of which there must be `count`. Problems: those of OpenContainer, chunks,
/// notRemoved.
KT_EXPORT ContainerProblem RemoveChunksFrom(const CFileRef& container, FourCC id, std::int64_t count);

/// A chunk to be added.
struct NewChunk {
    FourCC id = 0;         // of the chunk
    BytesView body = {};   // borrowed until the change is made
    bool replaces = false; // every chunk of its id goes first
    bool isForced = false; // add it despite an objection
};
/// Adds the chunk after the last one; first puts right a missing pad byte, stray bytes too few for a chunk, and an
/// open-ended CAF "data". Problems: those of RemoveChunksFrom, adding, notFound, misplaced; and status,
/// kStatusParameterError, when ObjectToAdding objects, unless forced.
KT_EXPORT ContainerProblem AddChunkTo(const CFileRef& container, const NewChunk& chunk);

/// Gives a "data" that reaches to the end of a CAF file its size, and does what PrepareToAppend does, so that any
/// writer can put a chunk after the last one. Problems: those of OpenContainer, status.
KT_EXPORT ContainerProblem SettleContainerEnd(const CFileRef& container);
