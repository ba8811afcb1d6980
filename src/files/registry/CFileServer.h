// CFileServer lets several clients of one process share the samples of the audio files that they use: the first
// registration of a file reads it, the last client that leaves frees it.
#pragma once

#include "files/registry/FileTable.h"

#include <cstdint>
#include <vector>

/// What is known of a registered file; the samples belong to the server.
struct TFileInfo {
    CFileRef ref;                   // the file
    const float* samples = nullptr; // interleaved, -1 to 1; null when they were not loaded
    float sampleRate = 0;           // in Hz
    std::uint32_t channels = 0;     // interleaved in `samples`
    std::uint32_t frames = 0;       // samples of each channel
};

/// Owns the samples of all registered files. Client ids are positive. One thread.
class KT_EXPORT CFileServer {
public:
    static constexpr unsigned int kRefused = 0xFFFFFFFF; // the result of Register that refuses a file

    /// A server for at most `maxFiles` files.
    explicit CFileServer(int maxFiles);
    ~CFileServer();
    CFileServer(const CFileServer&) = delete;
    CFileServer& operator=(const CFileServer&) = delete;

    /// The smallest id that is not registered. Asking does not register it.
    unsigned int CreateNewClientId() const;
    /// Registers a client of a file, and returns the number of the file's clients. kRefused for id 0, for a reference
    /// that is no existing file, and for a new file beyond `maxFiles`; 0 when the file cannot be opened or loaded.
    /// Samples of files with the extension "ubs" are not loaded.
    unsigned int Register(unsigned int clientId, const CFileRef* ref);
    /// Removes the client from all files, and the files that it was the last client of. Always 0.
    unsigned int UnRegister(unsigned int clientId);

    /// Loads a file into a container; with `skipSamples` only tries to open it, and frees the container's samples.
    /// False, and the samples freed, on failure.
    bool Open(const CFileRef* ref, TContainer& container, bool skipSamples);
    /// Frees the samples of a container.
    void Close(TContainer& container);
    /// Adds a client unless it is there; the number of clients.
    unsigned int Retain(unsigned int clientId, TContainer& container);
    /// Removes a client if it is there; the number of clients left.
    unsigned int Release(unsigned int clientId, TContainer& container);

    /// The facts of a file; all zero, with an invalid reference, when it is not registered.
    TFileInfo GetFileInfo(const CFileRef* ref) const;
    /// The facts of every file of the client, in the order of registration; valid until the next call.
    const std::vector<TFileInfo>& GetFileInfoVector(unsigned int clientId);
    /// Makes the first registered file of the same name (in the same case), sample rate, channels and frames be
    /// `newFile` from now on: `oldFile` gets its former reference, and the ids of its clients are returned. Empty,
    /// and nothing changed, when there is no such file or another is registered as `newFile`. The samples stay.
    std::vector<unsigned int> UpdateAudioFileInfo(const CFileRef* newFile, CFileRef& oldFile);
    /// The name of the client's first file, 255 bytes at most; empty when it has none. Kept: the text lies in one
    /// buffer for the whole process, which the next call overwrites.
    const char* GetFileNameFromFirstRef(unsigned int clientId, bool keepExtension) const;

    /// Whether the id is among `ids`.
    bool ClientIsRegistered(unsigned int clientId, std::vector<unsigned int>& ids) const;
    /// The greatest of the ids; 0 when there are none.
    unsigned int MaxClientId(std::vector<unsigned int>& ids) const;
    /// Puts `a` in the place of `b` in every file, and `b` in that of `a`. Kept: the registered ids stay as they are,
    /// even when only one of the two was registered.
    void SwapClients(unsigned int a, unsigned int b);

private:
    TContainer* Find(const CFileRef* ref) const;
    void AddClientId(unsigned int clientId);
    const TContainer* FirstOf(unsigned int clientId) const;
    TContainer* FindReplaced(const CFileRef& newFile, const char* name) const;

    FileTable files_;
    std::vector<TFileInfo> fileInfos_;
    std::vector<CFileRef> refs_;          // of files about to be removed
    std::vector<unsigned int> clientIds_; // ascending, each once
    std::int32_t maxFiles_;
};
