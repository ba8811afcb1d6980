// Ties an open stream to the file reference that it came from, in a registry of the process.
#pragma once

#include "audiofile/XStream.h"
#include "files/CFileRef.h"

/// Owns its stream. The registry has no lock: one thread at a time makes, finds and destroys savers.
class KT_EXPORT XStreamSaver {
public:
    /// Takes the stream (which may be null) over and becomes the first in the registry.
    XStreamSaver(void* stream, const CFileRef& ref);
    /// Leaves the registry and closes the stream.
    ~XStreamSaver();
    XStreamSaver(const XStreamSaver&) = delete;
    XStreamSaver& operator=(const XStreamSaver&) = delete;

    /// The stream, still owned here.
    XStreamRef GetStream() const { return stream_; }
    /// Where the stream came from.
    const CFileRef& GetFileRef() const { return ref_; }
    /// The saver made before this one, of those that live; null for none.
    XStreamSaver* GetNextXStreamObject() const { return next_; }

    /// The saver made last, of those that live; null for none.
    static XStreamSaver* GetFirstXStreamObject() { return s_First; }
    /// The latest saver whose reference equals `ref`; null for none.
    static XStreamSaver* FindXStreamObject(const CFileRef& ref);

private:
    static XStreamSaver* s_First;

    XStreamSaver* next_;
    XStreamRef stream_;
    CFileRef ref_;
};
