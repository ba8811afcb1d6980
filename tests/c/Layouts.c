/* The layouts and the numbers that C programs are compiled with. Nothing here changes: what comes is added. */
#include <ktfiles.h>

#define SAME(name, value, wanted) typedef char name[(value) == (wanted) ? 1 : -1]

SAME(InfoSize, sizeof(ktf_info), 88);
SAME(InfoFrames, offsetof(ktf_info, frames), 0);
SAME(InfoFileSize, offsetof(ktf_info, file_size), 8);
SAME(InfoDataSize, offsetof(ktf_info, data_size), 16);
SAME(InfoMissing, offsetof(ktf_info, missing_data_size), 24);
SAME(InfoRate, offsetof(ktf_info, sample_rate), 32);
SAME(InfoBeats, offsetof(ktf_info, beats), 40);
SAME(InfoTempo, offsetof(ktf_info, tempo), 48);
SAME(InfoChannels, offsetof(ktf_info, channels), 56);
SAME(InfoBits, offsetof(ktf_info, bits_per_sample), 60);
SAME(InfoSignificant, offsetof(ktf_info, significant_bits), 64);
SAME(InfoFlags, offsetof(ktf_info, flags), 68);
SAME(InfoContainer, offsetof(ktf_info, container), 72);
SAME(InfoForm, offsetof(ktf_info, form), 76);
SAME(InfoCoding, offsetof(ktf_info, coding), 80);
SAME(InfoSpeakers, offsetof(ktf_info, speakers), 84);

SAME(ChunkSize, sizeof(ktf_chunk), 32);
SAME(ChunkOffset, offsetof(ktf_chunk, offset), 0);
SAME(ChunkBody, offsetof(ktf_chunk, body), 8);
SAME(ChunkBodySize, offsetof(ktf_chunk, size), 16);
SAME(ChunkId, offsetof(ktf_chunk, id), 24);

SAME(OptionsSize, sizeof(ktf_edit_options), 16);
SAME(OptionsFlags, offsetof(ktf_edit_options, flags), 4);
SAME(OptionsTimeout, offsetof(ktf_edit_options, timeout), 8);

SAME(PairSize, sizeof(ktf_text_pair), 2 * sizeof(char*));
SAME(PairValue, offsetof(ktf_text_pair, value), sizeof(char*));

SAME(StatusSize, sizeof(ktf_status), 4);
SAME(CodeTextSize, KTF_CODE_TEXT_SIZE, 17);
SAME(Code, KTF_CODE('F', 'O', 'R', 'M'), 0x464F524Du);

SAME(Ok, KTF_OK, 0);
SAME(Failed, KTF_FAILED, -1);
SAME(Interrupted, KTF_INTERRUPTED, -27);
SAME(DiskFull, KTF_DISK_FULL, -34);
SAME(IOError, KTF_IO_ERROR, -36);
SAME(BadName, KTF_BAD_NAME, -37);
SAME(NotOpen, KTF_NOT_OPEN, -38);
SAME(EndOfFile, KTF_END_OF_FILE, -39);
SAME(BeforeStart, KTF_BEFORE_START, -40);
SAME(OutOfMemory, KTF_OUT_OF_MEMORY, -41);
SAME(TooManyOpenFiles, KTF_TOO_MANY_OPEN_FILES, -42);
SAME(FileNotFound, KTF_FILE_NOT_FOUND, -43);
SAME(Busy, KTF_BUSY, -47);
SAME(DuplicateName, KTF_DUPLICATE_NAME, -48);
SAME(ParameterError, KTF_PARAMETER_ERROR, -50);
SAME(BadReference, KTF_BAD_REFERENCE, -51);
SAME(ReadOnly, KTF_READ_ONLY, -61);
SAME(Cancelled, KTF_CANCELLED, -128);
SAME(NotAFile, KTF_NOT_A_FILE, -1302);
SAME(DifferentVolume, KTF_DIFFERENT_VOLUME, -1303);
SAME(FileTooBig, KTF_FILE_TOO_BIG, -1309);
SAME(NotAFolder, KTF_NOT_A_FOLDER, -1407);
SAME(QuotaExceeded, KTF_QUOTA_EXCEEDED, -1425);
SAME(AccessDenied, KTF_ACCESS_DENIED, -5000);
SAME(AuthenticationError, KTF_AUTHENTICATION_ERROR, -5023);
SAME(NotSupported, KTF_NOT_SUPPORTED, 0x666D743F);
SAME(NoRoom, KTF_NO_ROOM, 0x2173697A);
SAME(NotThere, KTF_NOT_THERE, 0x6E6F6E65);
SAME(WouldLose, KTF_WOULD_LOSE, 0x6C6F7365);

SAME(OpenContainer, KTF_OPEN_CONTAINER, 1);
SAME(LinearPCM, KTF_INFO_LINEAR_PCM, 1);
SAME(IsFloat, KTF_INFO_FLOAT, 2);
SAME(IsUnsigned, KTF_INFO_UNSIGNED, 4);
SAME(BigEndian, KTF_INFO_BIG_ENDIAN, 8);
SAME(Loop, KTF_INFO_LOOP, 16);
SAME(Stated, KTF_INFO_STATED, 32);
SAME(Incomplete, KTF_INFO_INCOMPLETE, 64);
SAME(HasChunks, KTF_INFO_HAS_CHUNKS, 128);
SAME(TakesChunks, KTF_INFO_TAKES_CHUNKS, 256);
SAME(Float32, KTF_FLOAT32, 1);
SAME(Int16, KTF_INT16, 2);
SAME(Int32, KTF_INT32, 3);
SAME(EditReplace, KTF_EDIT_REPLACE, 1);
SAME(EditForce, KTF_EDIT_FORCE, 2);
SAME(EditInPlace, KTF_EDIT_IN_PLACE, 4);
SAME(EditBackup, KTF_EDIT_BACKUP, 8);
SAME(EditKeepTimes, KTF_EDIT_KEEP_TIMES, 16);
SAME(EditLocked, KTF_EDIT_LOCKED, 32);
SAME(LockRead, KTF_LOCK_READ, 0);
SAME(LockWrite, KTF_LOCK_WRITE, 1);
