// Ties an open stream to the file reference that it came from, in a registry of the process.
#pragma once

#include "audiofile/XStream.h"
#include "files/CFileRef.h"

/// Owns its stream. The registry is not locked: savers are made, found and destroyed by one thread at a time.
class KT_EXPORT XStreamSaver {
public:
    /// Takes the stream over (which may be null) and becomes the first of the registry.
    XStreamSaver(void* stream, const CFileRef& ref);
    /// Leaves the registry and closes the stream.
    ~XStreamSaver();
    XStreamSaver(const XStreamSaver&) = delete;
    XStreamSaver& operator=(const XStreamSaver&) = delete;

    XStreamRef GetStream() const { return stream_; }
    const CFileRef& GetFileRef() const { return ref_; }
    /// The saver that was made before, of those that live.
    XStreamSaver* GetNextXStreamObject() const { return next_; }

    static XStreamSaver* GetFirstXStreamObject() { return s_First; }
    /// The latest saver whose reference equals `ref`, or null.
    static XStreamSaver* FindXStreamObject(const CFileRef& ref);

private:
    static XStreamSaver* s_First;

    XStreamSaver* next_;
    XStreamRef stream_;
    CFileRef ref_;
};
