// Turns the metadata chunks of each container into fields.
#pragma once

#include "audiofile/fields/MetaSource.h"
#include "audiofile/fields/readers/MetaFields.h"

#include <initializer_list>
#include <span>
#include <string>
#include <string_view>

/// Reads the fields of a chunk. False, without a field, if the chunk is not what its id promises.
using MetaRead = bool (*)(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);

struct MetaReader {
    FourCC id = 0;
    std::string_view group; // prefix of the names of its fields
    MetaRead read = nullptr;
    FourCC refersTo = 0; // id of the chunk to which its numbers refer
};

std::span<const MetaReader> waveReaders(); // RIFF, RF64, BW64, RIFX and Wave64
std::span<const MetaReader> aiffReaders();
std::span<const MetaReader> cafReaders();

// Shared by several containers.

/// Fields for XML by the path of each element; a single text if it is not well-formed.
bool readIXML(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// The number of elements of each kind in an ADM document.
bool readADM(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// The whole body up to trailing NULs.
bool readText(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
bool readHex(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// SMPTE ST 330, of 32 or 64 bytes.
bool readUMID(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
bool readID3(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// Size and first bytes of data for other programs.
bool readPreview(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);
/// "PEAK": the extreme of each channel, after 8 other bytes.
bool readPeaks(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields);

/// A UMID of 64 bytes, the second half of which may be zeros, as a whole and by parts: "umid", "umidLabel" …
void addUMID(const std::string& name, BytesView umid, MetaFields& fields);
bool anySet(BytesView bytes);
/// "01:02:03:04": at least two digits per number.
std::string clockFields(std::initializer_list<int> numbers);
