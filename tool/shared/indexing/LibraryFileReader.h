// Reads an audio file into a record of an index: described as the other verbs describe it, by the same code.
#pragma once

#include "tool/shared/library/LibraryRecord.h"

#include <functional>
#include <optional>

/// What is read beside the description.
struct LibraryReading {
    bool overview = true; // the waveform, which takes all samples
    bool hash = false;    // of the samples; digests that the file states are compared with them too
    bool waits = true;    // for programs that hold the file by coordination, for a while; else it is read without
    std::function<bool()> goesOn = {}; // asked now and then on the way through samples: its no ends a reading early
};

/// The record of the file of a place, which had that stamp when it was found. None for a file that is no audio and is
/// not called audio, and for one that is no longer there. A file that cannot be read, or is called audio and is none,
/// gives a record with the state "unreadable" and a problem; "inUse" is the kind of the problem if another program
/// holds the file.
///
/// The stamp of the record belongs to the bytes that were read: a file that kept changing, is in use, or was not read
/// to its end gets one that no file has, with `inode` and `changed` 0, so that it is read again. Throws std::bad_alloc,
/// nothing else.
std::optional<LibraryRecord> readLibraryRecord(const FilePlace& place, const SeenStamp& stamp,
                                               const LibraryReading& wanted);

/// Whether the record says no more than that another program holds the file: what an index knew before is worth more.
bool isInUse(const LibraryRecord& record);
