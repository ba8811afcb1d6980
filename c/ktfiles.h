// KTFiles for C99, and for whatever calls C: the files that music projects are made of, opened, described, read and
// safely changed.
//
//     ktf_file* file = NULL;
//     if (ktf_open("loop.wav", 0, &file) != KTF_OK)
//         fprintf(stderr, "%s\n", ktf_last_error());
//     ...
//     ktf_close(&file);
//
// Errors. A function returns KTF_OK or another status; ktf_last_error() then says in words what was wrong with which
// file. Null where an object, a path or a result is needed is KTF_PARAMETER_ERROR. On failure results are null or 0,
// unless it is said that they count.
//
// Texts are UTF-8 and end with a NUL; paths are bytes as the system has them, relative to the working folder unless
// they begin with a slash, and "~" means nothing in them. What a callback is given is valid during the call only.
//
// Threads. A handle is used by one thread at a time; different handles, and functions that take a path, may be used on
// different threads. A callback runs on the calling thread and must not use the handle that it is called for. It must
// return: longjmp out of it leaks; an exception thrown in it ends the call with KTF_FAILED.
//
// What will stay. Numbers of enums, layouts of structs and what functions mean do not change while the library's soname
// is libKTFiles.so.0. New functions and values come, and new members at the end of structs, for which the caller says
// the size that he was compiled with.
#pragma once

#include <stddef.h>
#include <stdint.h>

/// The version of this header, 0.1.0: its first number.
#define KTF_VERSION_MAJOR 0
/// Its second number.
#define KTF_VERSION_MINOR 1
/// Its third number.
#define KTF_VERSION_PATCH 0
/// The same as one number: 10,000 times the major, 100 times the minor, and the patch.
#define KTF_VERSION (KTF_VERSION_MAJOR * 10000 + KTF_VERSION_MINOR * 100 + KTF_VERSION_PATCH)

/// What the library exports.
#if defined(__GNUC__)
#define KTF_API __attribute__((visibility("default")))
#else
#define KTF_API
#endif

/// A four-character code of characters: KTF_CODE('b', 'e', 'x', 't'). The first is the most significant byte, in files
/// of either byte order.
#define KTF_CODE(a, b, c, d)                                                                                           \
    ((uint32_t)(unsigned char)(a) << 24 | (uint32_t)(unsigned char)(b) << 16 | (uint32_t)(unsigned char)(c) << 8 |     \
     (uint32_t)(unsigned char)(d))

#ifdef __cplusplus
extern "C" {
#endif

// ---- Status --------------------------------------------------------------------------------------------------------

/// 0, or why something failed: one of ktf_status_code, or another number that ktf_status_text() knows no words for.
typedef int32_t ktf_status;

/// The statuses.
enum ktf_status_code {
    KTF_OK = 0,                       ///< no error
    KTF_FAILED = -1,                  ///< for a reason that has no number of its own
    KTF_INTERRUPTED = -27,            ///< by a signal
    KTF_DISK_FULL = -34,              ///< no room on the disk
    KTF_IO_ERROR = -36,               ///< also every error of the system that is not listed here
    KTF_BAD_NAME = -37,               ///< a name that is too long
    KTF_NOT_OPEN = -38,               ///< the file is not open
    KTF_END_OF_FILE = -39,            ///< the file ends ahead of what it promises
    KTF_BEFORE_START = -40,           ///< a place below 0
    KTF_OUT_OF_MEMORY = -41,          ///< also no thread to be had
    KTF_TOO_MANY_OPEN_FILES = -42,    ///< in this process
    KTF_FILE_NOT_FOUND = -43,         ///< or a folder of its path is not
    KTF_BUSY = -47,                   ///< others use the file; or another program changed it meanwhile
    KTF_DUPLICATE_NAME = -48,         ///< the name is taken
    KTF_PARAMETER_ERROR = -50,        ///< also null pointers, and a folder where a file is needed
    KTF_BAD_REFERENCE = -51,          ///< symbolic links in a circle, or a file that is gone
    KTF_READ_ONLY = -61,              ///< the file system is
    KTF_CANCELLED = -128,             ///< by a callback
    KTF_NOT_A_FILE = -1302,           ///< a FIFO, a socket or a device
    KTF_DIFFERENT_VOLUME = -1303,     ///< not to be had across file systems
    KTF_FILE_TOO_BIG = -1309,         ///< for the container, or the file system
    KTF_NOT_A_FOLDER = -1407,         ///< a file where a folder is needed
    KTF_QUOTA_EXCEEDED = -1425,       ///< the user's share of the disk is full
    KTF_ACCESS_DENIED = -5000,        ///< permissions are missing
    KTF_AUTHENTICATION_ERROR = -5023, ///< a key of the file system is missing
    KTF_NOT_SUPPORTED = 0x666D743F, ///< "fmt?": no audio or container that is known here, or one that a module decodes
                                    ///< which is not installed
    KTF_NO_ROOM = 0x2173697A,       ///< "!siz": the caller's buffer is too small
    KTF_NOT_THERE = 0x6E6F6E65,     ///< "none": the file has no such chunk
    KTF_WOULD_LOSE = 0x6C6F7365     ///< "lose": the edit would cost sound or other data; nothing was done
};

/// A short English text for a status ("disk full"), never null, that need not be freed.
KTF_API const char* ktf_status_text(ktf_status status);
/// What the last call that failed on this thread found wrong, "loop.wav: file not found", with the name of the file as
/// the caller gave it; "" when none has failed. Never null. Valid until another call fails on this thread.
KTF_API const char* ktf_last_error(void);
/// The version of the library that is loaded, as KTF_VERSION counts.
KTF_API uint32_t ktf_version(void);

/// Bytes that ktf_code_text() needs.
#define KTF_CODE_TEXT_SIZE 17
/// Writes the four characters of a code and a NUL to `text`: "RIFF". A byte that is not printable ASCII, and the
/// backslash, is written as four characters, "\xA9". Returns `text`, or null for null.
KTF_API char* ktf_code_text(uint32_t code, char text[KTF_CODE_TEXT_SIZE]);
/// Frees what a function of this library has allocated for the caller; nothing happens for null.
KTF_API void ktf_free(void* memory);

// ---- Files ---------------------------------------------------------------------------------------------------------

/// An audio file that is open for reading. An edit puts another file in its place, which the handle does not see: open
/// it again. Samples are opened by the path, relative to the working folder of ktf_open(), when they are first asked
/// for.
typedef struct ktf_file ktf_file;

/// Flags of ktf_open().
enum ktf_open_flag {
    KTF_OPEN_CONTAINER = 1 ///< take any container of chunks, also one whose sound is damaged, missing or unknown
};

/// Opens an audio file of any format that the library reads: WAVE, RF64, BW64, AIFF, AIFC, CAF and others by itself,
/// and with the module of decoders (package libktfiles-ffmpeg) MP3, AAC, FLAC, Ogg and many more. `flags` are those of
/// ktf_open_flag, or 0. `*file` must go to ktf_close(). KTF_NOT_SUPPORTED for what is no audio.
KTF_API ktf_status ktf_open(const char* path, uint32_t flags, ktf_file** file);
/// Closes the file and sets the pointer to null; nothing happens for null, and for a pointer to null.
KTF_API void ktf_close(ktf_file** file);

/// Flags of ktf_info.
enum ktf_info_flag {
    KTF_INFO_LINEAR_PCM = 1,    ///< samples are stored as they are, not compressed
    KTF_INFO_FLOAT = 2,         ///< and are floats
    KTF_INFO_UNSIGNED = 4,      ///< and are unsigned integers
    KTF_INFO_BIG_ENDIAN = 8,    ///< and have their most significant byte first
    KTF_INFO_LOOP = 16,         ///< the file's loop chunks say that it is a loop
    KTF_INFO_STATED = 32,       ///< `frames` is what a header claims, which ktf_frame_count() proves
    KTF_INFO_INCOMPLETE = 64,   ///< sound is missing that the headers promise
    KTF_INFO_HAS_CHUNKS = 128,  ///< ktf_each_chunk() finds some
    KTF_INFO_TAKES_CHUNKS = 256 ///< ktf_add_chunk() adds to its container; others are only read
};

/// What an audio file is. What is not known is 0.
typedef struct ktf_info {
    int64_t frames;            ///< at the file's rate
    int64_t file_size;         ///< bytes
    int64_t data_size;         ///< bytes of samples that are there; 0 when compressed
    int64_t missing_data_size; ///< bytes of samples that the header promises and the file ends ahead of
    double sample_rate;        ///< hertz
    double beats;              ///< of the loop; 0 when the file does not say
    double tempo;              ///< of the loop, in beats per minute
    uint32_t channels;         ///< 0 only where the sound is not known
    uint32_t bits_per_sample;  ///< of a sample as it is stored: 24 for 20 bits in 3 bytes; 0 when compressed
    uint32_t significant_bits; ///< of these, those that count; of lossless codings those of what was coded
    uint32_t flags;            ///< of ktf_info_flag
    uint32_t container;        ///< code: "RIFF", "RF64", "BW64", "FORM", "caff"; of others the file type
    uint32_t form;             ///< code: "WAVE", "AIFF", "AIFC"; 0 where the container has none
    uint32_t coding;           ///< code: "lpcm" for linear PCM, "alac", "flac", ".mp3"; "ms" and the tag of WAVE
    uint32_t speakers;         ///< those that the channels feed, as bits of WAVE's channel mask
} ktf_info;

/// Fills `*info`, which has `size` bytes, sizeof(ktf_info): what the library that is loaded does not know is 0.
/// KTF_PARAMETER_ERROR for fewer than the 88 bytes of the first version.
KTF_API ktf_status ktf_get_info(ktf_file* file, ktf_info* info, size_t size);

// ---- Samples -------------------------------------------------------------------------------------------------------

/// How samples come to the caller, in the byte order of the processor.
enum ktf_sample_type {
    KTF_FLOAT32 = 1, ///< full scale is -1 to 1, and more is possible where the file's samples are floats
    KTF_INT16 = 2,   ///< full scale is -32768 to 32767
    KTF_INT32 = 3    ///< full scale whatever the file has: samples of 24 bits are the upper ones
};

/// Says what ktf_read() gives from now on: interleaved samples of a ktf_sample_type, at `sample_rate` whole hertz and
/// with so many channels; 0 for those of the file. At first that is KTF_FLOAT32, 0, 0. One channel goes to all, all are
/// averaged to one, else surplus channels are left out and missing ones are silent. The place is 0 afterwards. On
/// failure all stays as it was; KTF_NOT_SUPPORTED for another rate where the module of decoders is not installed.
KTF_API ktf_status ktf_set_format(ktf_file* file, int32_t sample_type, uint32_t sample_rate, uint32_t channels);
/// How many frames there are to read, at the rate that was asked for. Exact, also of compressed files.
KTF_API ktf_status ktf_frame_count(ktf_file* file, int64_t* frames);
/// Puts the place of the next ktf_read() at a frame, which counts from 0 at the rate that was asked for. Past the end
/// nothing is read. KTF_BEFORE_START below 0.
KTF_API ktf_status ktf_seek(ktf_file* file, int64_t frame);
/// Reads up to `frames` frames from the place on, which moves behind them, into `buffer`, which has room for that many
/// and is aligned for its samples. `*frames_read` is fewer only at the end of the file, and 0 there; on failure it
/// counts those that were read ahead of it. What the file does not hold or cannot be decoded within it, as where it is
/// damaged, is silence.
KTF_API ktf_status ktf_read(ktf_file* file, void* buffer, size_t frames, size_t* frames_read);

/// The picture of a part of the file: its `frames` frames from `first` on (at the file's rate, clipped to its end) are
/// divided into `points` equal pieces, and of each channel the lowest and the highest sample of each piece go to
/// `values`: 2 * channels * points floats, ordered by point, then channel, then lowest and highest. Silence counts, so
/// that the lowest is at most 0 and the highest at least 0. Fewer frames than points are told more than once; pieces
/// that have none are 0. `room` is how many floats there is room for: KTF_NO_ROOM when these are too few. All channels
/// of the file are read, whatever ktf_set_format() said, and the place stays. Points: 1 to 2^31 - 1.
KTF_API ktf_status ktf_overview(ktf_file* file, int64_t first, int64_t frames, uint32_t points, float* values,
                                size_t room);

// ---- Chunks --------------------------------------------------------------------------------------------------------

/// A chunk of the container.
typedef struct ktf_chunk {
    int64_t offset;    ///< of its header, in the file
    int64_t body;      ///< of its body, in the file
    int64_t size;      ///< bytes of the body, as its header says: of a damaged file more than there are, or negative
    uint32_t id;       ///< code
    uint32_t reserved; ///< 0
} ktf_chunk;

/// Called for a chunk; 0 to go on, anything else to stop.
typedef int (*ktf_chunk_function)(void* context, const ktf_chunk* chunk);

/// Calls `function` for each chunk in the order of the file. KTF_OK also when it stopped; KTF_NOT_SUPPORTED for a file
/// that has no chunks; KTF_END_OF_FILE for one that ends within its header.
KTF_API ktf_status ktf_each_chunk(ktf_file* file, ktf_chunk_function function, void* context);
/// Finds a chunk by its id: of several the last, in CAF the first that is not empty. Fills `*chunk`,
/// which has `size` bytes, sizeof(ktf_chunk), at least 32. KTF_NOT_THERE when there is none.
KTF_API ktf_status ktf_find_chunk(ktf_file* file, uint32_t id, ktf_chunk* chunk, size_t size);
/// Reads the chunk's body from `offset` on (0 is its first byte): up to `size` bytes, and `*read` tells how many. Fewer
/// at the end of the body, none behind it; KTF_END_OF_FILE when the file ends ahead of it, with `*read` those that are
/// there.
KTF_API ktf_status ktf_read_chunk(ktf_file* file, const ktf_chunk* chunk, int64_t offset, void* buffer, size_t size,
                                  size_t* read);

/// Flags of ktf_edit_options.
enum ktf_edit_flag {
    KTF_EDIT_REPLACE = 1,     ///< ktf_add_chunk: in the place of all chunks that have the id
    KTF_EDIT_FORCE = 2,       ///< also where it costs sound or other data (KTF_WOULD_LOSE)
    KTF_EDIT_IN_PLACE = 4,    ///< change the file itself: for files too large to copy, and for those of several names
    KTF_EDIT_BACKUP = 8,      ///< keep the original as NAME.bak, NAME.bak.1 and so on, beside it
    KTF_EDIT_KEEP_TIMES = 16, ///< the time of the last modification stays
    KTF_EDIT_LOCKED = 32      ///< the caller holds the file for writing (ktf_lock): do not ask for that again
};

/// How an edit is made. Begin with KTF_EDIT_OPTIONS; null stands for that too.
typedef struct ktf_edit_options {
    uint32_t size;  ///< sizeof(ktf_edit_options)
    uint32_t flags; ///< of ktf_edit_flag
    double timeout; ///< seconds to wait for others, for each of coordinated access and other edits; below 0 for ever
} ktf_edit_options;

/// Waits for others for as long as that takes.
#define KTF_EDIT_OPTIONS                                                                                               \
    {                                                                                                                  \
        sizeof(ktf_edit_options), 0, -1.0                                                                              \
    }

// Edits have coordinated write access to the file (ktf_lock). They are made to a copy in the same folder, which takes
// the file's place with its owner, permissions and extended attributes when all that the edit is not about is in it as
// it was, to the byte. On failure the file is as it was; with KTF_EDIT_IN_PLACE it is as the edit left it. KTF_BUSY
// when the time was up, or another program changed the file meanwhile.

/// Puts a chunk of `size` bytes at `body` (null for none) behind the container's last one. KTF_PARAMETER_ERROR for the
/// id 0; KTF_NOT_SUPPORTED for a file whose container takes no chunks; KTF_WOULD_LOSE for a second chunk of an id that
/// describes or holds the sound, and where other data stands behind the last chunk.
KTF_API ktf_status ktf_add_chunk(const char* path, uint32_t id, const void* body, size_t size,
                                 const ktf_edit_options* options);
/// Removes every chunk of the id. KTF_NOT_THERE when there is none; KTF_WOULD_LOSE for one that describes or holds the
/// sound.
KTF_API ktf_status ktf_remove_chunk(const char* path, uint32_t id, const ktf_edit_options* options);

// ---- Tags and metadata ---------------------------------------------------------------------------------------------

/// Called for a text and its name; 0 to go on, anything else to stop.
typedef int (*ktf_text_function)(void* context, const char* name, const char* value);

/// A text and its name, of the caller.
typedef struct ktf_text_pair {
    const char* name;  ///< never null
    const char* value; ///< null to clear what has the name
} ktf_text_pair;

/// Calls `function` for each tag of a loop, a WAVE, AIFF or CAF file: under "fileType", "containerName", "sampleRate",
/// "frames" and "durationSeconds" what the sound is, then what is known of it as a loop: "beatCount", "tempo",
/// "midiRootNote" (48 to 59: C to B), "key", "keyType" (1 minor, 2 major, 3 neither, 4 both), "mode", "signatureTop",
/// "signatureBottom", "signature", "loopFileType" (1 for a loop, 2 for a one-shot), "instrumentType",
/// "instrumentSubType", "genre", "descriptors", "title", "artist", "copyright", "comments", "transients" (frames).
/// Lists are told one by one under the same name; numbers are decimal. KTF_OK also when the function stopped it;
/// KTF_NOT_SUPPORTED for other files.
KTF_API ktf_status ktf_each_tag(const char* path, ktf_text_function function, void* context);
/// Sets `count` tags of an AIFF or CAF file, by a safe edit: those above but for what the sound is, "tempo", "key",
/// "mode" and "signature", which follow from others. "midiRootNote" takes a key ("F#"), "keyType" a mode ("minor"). A
/// list is given by several pairs of one name. What is not named stays; nothing is written where nothing changes.
/// KTF_PARAMETER_ERROR for an unknown name and a value that the tag can never have; KTF_WOULD_LOSE where the file
/// cannot keep a value, or another tag would be lost; KTF_NOT_SUPPORTED for other files.
KTF_API ktf_status ktf_set_tags(const char* path, const ktf_text_pair* tags, size_t count,
                                const ktf_edit_options* options);
/// Removes all of these tags from an AIFF or CAF file, by a safe edit.
KTF_API ktf_status ktf_remove_tags(const char* path, const ktf_edit_options* options);

/// Calls `function` for each field of what a file says about itself: of WAVE, RF64, BW64, AIFF, AIFC and CAF those of
/// their chunks ("bext.originator", "info.IART", "cue[1].label"), of others those of their tags, which needs the module
/// of tags (package libktfiles-taglib). Names are those of `ktfiles meta`; numbers are decimal, of bytes the
/// hexadecimal of the first is told. KTF_OK also when the function stopped it; KTF_NOT_SUPPORTED for what is no audio,
/// or for want of the module.
KTF_API ktf_status ktf_each_field(const char* path, ktf_text_function function, void* context);

// ---- ADM -----------------------------------------------------------------------------------------------------------

/// The ADM document (ITU-R BS.2076) of an XML file, or of the chunk "axml" of an audio file, as JSON: an object with
/// the members of `ktfiles adm --json`, "path" being the path as it was given; times are microseconds. `*text`, with a
/// NUL behind its `*size` bytes (null where that is not wanted), must go to ktf_free(). KTF_NOT_THERE for an audio file
/// without one; KTF_NOT_SUPPORTED for what is neither XML nor a container; KTF_FAILED for a document that breaks a
/// rule.
KTF_API ktf_status ktf_adm_json(const char* path, char** text, size_t* size);

// ---- Locks ---------------------------------------------------------------------------------------------------------

/// Coordinated access to a file, which holds back other users of this library, in this process and in others of the
/// same user. The file itself stays open to everybody else. A process that ends, however it does, lets go of what it
/// held.
typedef struct ktf_access ktf_access;

/// Kinds of access.
enum ktf_lock_mode {
    KTF_LOCK_READ = 0, ///< beside other readers; nobody writes
    KTF_LOCK_WRITE = 1 ///< alone
};

/// Asks for access to the file at the path, which need not exist yet, and waits for others for `timeout` seconds: 0
/// does not wait, below 0 waits for ever. First come, first served. `*access` must go to ktf_unlock(), on any thread.
/// KTF_BUSY when the time was up; KTF_PARAMETER_ERROR for another mode and a timeout that is no number. Asking twice on
/// one thread, where one of them writes, waits for itself.
KTF_API ktf_status ktf_lock(const char* path, int32_t mode, double timeout, ktf_access** access);
/// Ends the access and sets the pointer to null; nothing happens for null, and for a pointer to null.
KTF_API void ktf_unlock(ktf_access** access);

#ifdef __cplusplus
} // extern "C"
#endif
