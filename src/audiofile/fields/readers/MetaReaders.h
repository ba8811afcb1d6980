// How the metadata chunks of each container become fields.
#pragma once

#include "audiofile/fields/MetaSource.h"
#include "audiofile/fields/readers/MetaFields.h"

#include <initializer_list>
#include <span>
#include <string>
#include <string_view>

/// Puts what a chunk says into fields. False, with no field, when it is not what its id promises.
using MetaRead = bool (*)(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);

struct MetaReader {
    FourCC id = 0;
    std::string_view group; // ahead of the names of its fields
    MetaRead read = nullptr;
    FourCC refersTo = 0; // the id of the chunk in which it looks up what its own says in numbers
};

std::span<const MetaReader> waveReaders(); // of RIFF, RF64, BW64, RIFX and Wave64
std::span<const MetaReader> aiffReaders();
std::span<const MetaReader> cafReaders();

// Of several containers:

/// XML as fields by the path of each element; as one text where it is not well-formed.
bool readIXML(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// How many elements of each kind an ADM document has.
bool readADM(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// The whole body up to NULs at its end.
bool readText(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
bool readHex(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// SMPTE ST 330, of 32 or 64 bytes.
bool readUMID(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
bool readID3(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// The size and the first bytes of what is for other programs.
bool readPreview(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// "PEAK": the extreme of each channel, with 8 bytes ahead of them.
bool readPeaks(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);

/// All of a UMID of 64 bytes, the second half of which may be zeros, and its parts: "umid", "umidLabel" …
void addUMID(const std::string& name, BytesView umid, MetaFields& fields);
bool anySet(BytesView bytes);
/// "01:02:03:04", of two digits each, and more where it must be.
std::string clockFields(std::initializer_list<int> numbers);
