// CFileServer lets several clients of one process share the samples of the audio files that they use: the first
// registration of a file reads it, the last client that leaves frees it.
#pragma once

#include "files/registry/FileTable.h"

#include <cstdint>
#include <vector>

/// What is known of a registered file. The samples are the container's.
struct TFileInfo {
    CFileRef ref;
    const float* samples = nullptr; // interleaved; null when they were not loaded
    float sampleRate = 0;
    std::uint32_t channels = 0;
    std::uint32_t frames = 0;
};

/// Owns the samples. Used by one thread. Client ids are positive.
class KT_EXPORT CFileServer {
public:
    static constexpr unsigned int kRefused = 0xFFFFFFFF;

    /// No more than `maxFiles` files can be registered.
    explicit CFileServer(int maxFiles);
    ~CFileServer();
    CFileServer(const CFileServer&) = delete;
    CFileServer& operator=(const CFileServer&) = delete;

    /// The smallest id that is not registered. It is not registered by that.
    unsigned int CreateNewClientId() const;
    /// The number of the file's clients. kRefused for id 0, for what is no existing file, and for a new file when there
    /// are `maxFiles`; 0 when it cannot be opened or loaded. Samples of files with the extension "ubs" are not loaded.
    unsigned int Register(unsigned int clientId, const CFileRef* ref);
    /// Removes the client from all files, and the files that it was the last client of. 0.
    unsigned int UnRegister(unsigned int clientId);

    /// Loads a file into a container; with `skipSamples` only sees whether it can be opened, and frees the container's
    /// samples. False, and the samples freed, when it cannot be loaded.
    bool Open(const CFileRef* ref, TContainer& container, bool skipSamples);
    /// Frees the samples.
    void Close(TContainer& container);
    /// Adds a client that is not there yet; the number of clients.
    unsigned int Retain(unsigned int clientId, TContainer& container);
    /// Removes a client that is there; the number of clients left.
    unsigned int Release(unsigned int clientId, TContainer& container);

    /// All zero, with an invalid reference, when the file is not registered.
    TFileInfo GetFileInfo(const CFileRef* ref) const;
    /// Of every file of the client, in the order of registration. Valid until the next call.
    const std::vector<TFileInfo>& GetFileInfoVector(unsigned int clientId);
    /// Lets the first registered file of the same name (in the same case), sample rate, channels and frames be
    /// `newFile` from now on: `oldFile` becomes the reference that it had, and the ids of its clients are returned.
    /// None, and nothing changed, when there is no such file, and when another is registered under the new reference.
    /// The samples stay as they are.
    std::vector<unsigned int> UpdateAudioFileInfo(const CFileRef* newFile, CFileRef& oldFile);
    /// The name of the client's first file, 255 bytes at most; empty when it has none. Kept: in one buffer for the
    /// whole process, which the next call overwrites.
    const char* GetFileNameFromFirstRef(unsigned int clientId, bool keepExtension) const;

    bool ClientIsRegistered(unsigned int clientId, std::vector<unsigned int>& ids) const;
    /// 0 for none.
    unsigned int MaxClientId(std::vector<unsigned int>& ids) const;
    /// In every file, `a` takes the place of `b` and `b` that of `a`. Kept: the registered ids stay as they are, also
    /// when only one of the two was registered.
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
