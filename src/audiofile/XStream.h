// Audio files for C callers, in any format that the converting reader decodes, as interleaved linear PCM of the
// caller's choice. For C99 and C++ compilers. One thread at a time uses a stream.
//
// Every function returns 0, -50 for a parameter error, -4 from the three that streams do not offer, or another
// negative or four-character status of the services below.
#pragma once

#include "platform/core/Export.h"

#include <stdint.h>

/// An open stream, to be closed by XStreamClose.
typedef void* XStreamRef;
/// A created file, to be closed by XStreamCloseFile.
typedef void* XStreamFileRef;

/// Made by C++ hosts; C callers pass it on.
#ifdef __cplusplus
class CFileRef;
#else
typedef struct CFileRef CFileRef;
#endif

/// How audio data is coded, in host order (platform::StreamDescription).
typedef struct XStreamDescription {
    double sampleRate;         //  0  hertz
    uint32_t formatId;         //  8  "lpcm" for linear PCM
    uint32_t formatFlags;      // 12  bit 0 float, 1 big-endian, 2 signed integer, 3 packed
    uint32_t bytesPerPacket;   //  16  0: packets differ in size
    uint32_t framesPerPacket;  //  20  1 for linear PCM
    uint32_t bytesPerFrame;    //  24  0 for compressed data
    uint32_t channelsPerFrame; //  28  interleaved
    uint32_t bitsPerChannel;   //  32  0 for compressed data
    uint32_t reserved;         //  36  0
} XStreamDescription;

/// Where channels are (platform::ChannelLayout).
typedef struct XStreamChannelLayout {
    ///  0  0x10000: `bitmap` counts; 0: `descriptions`; others have their channel count in the low 16 bits
    uint32_t tag;
    uint32_t bitmap;           //  4  a bit for each speaker
    uint32_t descriptionCount; //  8  how many descriptions there are
    struct {
        uint32_t label;       // 12  what the channel is
        uint32_t flags;       // 16  0
        float coordinates[3]; // 20  where it is, when the label says so
    } descriptions[1];        // as many as `descriptionCount`
} XStreamChannelLayout;

/// What XStreamReadFrames is to do, and did.
typedef struct XStreamReadRequest {
    void* link;                            //  0  not used
    int64_t position;                      //  8  first frame
    uint32_t framesRequested;              // 16  at most so many are read
    uint32_t framesRead;                   // 20  out
    void (*completion)(void* userPointer); // 24  called after a successful read; may be null
    void* userPointer;                     // 32  passed to `completion`
    void* completionState;                 // 40  null once `completion` has returned
    uint32_t bytesRead;                    // 48  out
    void* buffer;                          // 56  for interleaved frames of the client format, aligned for its samples
} XStreamReadRequest;

#ifdef __cplusplus
extern "C" {
#endif

/// Creates an audio file `name` (UTF-8) in `folder`: a container "WAVE", "AIFF", "AIFC" or "caff" for linear PCM. The
/// low byte of `flags` are creation flags; bit 0 empties a file that exists. `*outFile` is for XStreamCloseFile, in C++
/// a platform::AudioFile behind its AudioHandle.
KT_EXPORT int32_t XStreamCreateWithFileRef(const CFileRef* folder, const char* name, uint32_t flags, uint32_t reserved1,
                                           uint32_t fileType, const XStreamDescription* format, uint32_t reserved2,
                                           uint32_t reserved3, XStreamFileRef* outFile);
/// Closes what XStreamCreateWithFileRef made; -50 for anything else, as for the file that a stream has open ("afil").
KT_EXPORT int32_t XStreamCloseFile(XStreamFileRef file);
/// Opens what the reference names, whose path must have at most 1,023 bytes; only the low byte of `flags` counts.
KT_EXPORT int32_t XStreamOpenWithFileRef(const CFileRef* ref, uint32_t flags, uint32_t reserved1, uint32_t reserved2,
                                         const XStreamDescription* clientFormat,
                                         const XStreamChannelLayout* clientLayout, XStreamRef* outStream);
/// Opens a file by its path. Without a client format (null) frames come as near to the file's own format as they can
/// be; without one the layout is not looked at. Positions and counts are frames of the client format's rate, where
/// "#frm" counts the file's. On failure `*outStream` is null. "fmt?" for what cannot be decoded, or not to the client
/// format, both also for want of the decoder module (media/decoding/ConvertingReader.h); -66566 for an MP3 file without
/// a valid frame, unless bit 0 of `flags` is set.
KT_EXPORT int32_t XStreamOpen(const char* path, uint32_t flags, uint32_t reserved1, uint32_t reserved2,
                              const XStreamDescription* clientFormat, const XStreamChannelLayout* clientLayout,
                              XStreamRef* outStream);
/// Closes a stream; its file too.
KT_EXPORT int32_t XStreamClose(XStreamRef stream);

/// Reads `frames` frames from `position` on into `buffer`; fewer at the end of the file, and none past it, with 0 as
/// the status. Both counts may be null, and are 0 on failure.
KT_EXPORT int32_t XStreamReadFramesSync(XStreamRef stream, int64_t position, uint32_t frames, uint32_t* outFramesRead,
                                        void* buffer, uint32_t* outBytesRead);
/// The same; it too returns when all is done. On failure the request is as it was.
KT_EXPORT int32_t XStreamReadFrames(XStreamRef stream, XStreamReadRequest* request);
/// Not offered: always -4.
KT_EXPORT int32_t XStreamWriteFrames(XStreamRef stream, XStreamReadRequest* request);
/// Each is not offered: always -4.
KT_EXPORT int32_t XStreamReadPackets(XStreamRef stream, XStreamReadRequest* request);
KT_EXPORT int32_t XStreamWritePackets(XStreamRef stream, XStreamReadRequest* request);

/// The size of a property's value, and whether it can be set. Only created files have any here ("ffmt", "dfmt",
/// "bcnt", "pcnt", "doff"); -50 for a stream. Either result may be null.
KT_EXPORT int32_t XStreamGetPropertyInfo(XStreamRef stream, uint32_t id, uint32_t* outSize, uint32_t* outWritable);
/// "#fmt": the type code of the file, 4 bytes ("!siz" for another size), "AIFF" for AIFC. Others are properties of the
/// reader (media/decoding/ConvertingReader.h), or else of its underlying file. `*ioSize` is the room, then the value's
/// size.
KT_EXPORT int32_t XStreamGetProperty(XStreamRef stream, uint32_t id, uint32_t* ioSize, void* outData);
/// Sets a property of the reader; what it does not have goes to the audio-file service, with the handle as it is.
KT_EXPORT int32_t XStreamSetProperty(XStreamRef stream, uint32_t id, uint32_t size, const void* data);

#ifdef __cplusplus
} // extern "C"

/// The same by reference.
inline int32_t XStreamCreateWithFileRef(const CFileRef& folder, const char* name, uint32_t flags, uint32_t reserved1,
                                        uint32_t fileType, const XStreamDescription* format, uint32_t reserved2,
                                        uint32_t reserved3, XStreamFileRef* outFile)
{
    return XStreamCreateWithFileRef(&folder, name, flags, reserved1, fileType, format, reserved2, reserved3, outFile);
}

/// The same by reference.
inline int32_t XStreamOpenWithFileRef(const CFileRef& ref, uint32_t flags, uint32_t reserved1, uint32_t reserved2,
                                      const XStreamDescription* clientFormat, const XStreamChannelLayout* clientLayout,
                                      XStreamRef* outStream)
{
    return XStreamOpenWithFileRef(&ref, flags, reserved1, reserved2, clientFormat, clientLayout, outStream);
}
#endif
