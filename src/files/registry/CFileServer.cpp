#include "files/registry/CFileServer.h"

#include "files/registry/SampleLoading.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace {

constexpr char kUnloadedExtension[] = "ubs";

bool contains(const std::vector<unsigned int>& ids, unsigned int id)
{
    return std::find(ids.begin(), ids.end(), id) != ids.end();
}

bool isExistingFile(const CFileRef* ref)
{
    return ref != nullptr && ref->IsFile();
}

TFileInfo infoOf(const TContainer& container)
{
    return {container.ref, container.samples.get(), container.sampleRate, container.channels, container.frames};
}

std::string nameWithoutExtension(const CFileRef& ref)
{
    std::string name = ref.CopyFileName().utf8();
    if (const platform::String extension = ref.CopyFileExtension(); !extension.isNull())
        name.resize(name.size() - extension.utf8().size() - 1);
    return name;
}

} // namespace

CFileServer::CFileServer(int maxFiles)
    : files_(static_cast<std::size_t>(std::max(maxFiles, 0)), kTContainerValueCallbacks),
      maxFiles_(maxFiles)
{
}

CFileServer::~CFileServer()
{
    while (!clientIds_.empty())
        UnRegister(clientIds_.back());
}

unsigned int CFileServer::CreateNewClientId() const
{
    unsigned int id = 1;
    for (const unsigned int taken : clientIds_) {
        if (taken != id)
            break;
        ++id;
    }
    return id;
}

TContainer* CFileServer::Find(const CFileRef* ref) const
{
    return ref != nullptr ? files_.find(ref->URL()) : nullptr;
}

void CFileServer::AddClientId(unsigned int clientId)
{
    const auto place = std::lower_bound(clientIds_.begin(), clientIds_.end(), clientId);
    if (place == clientIds_.end() || *place != clientId)
        clientIds_.insert(place, clientId);
}

unsigned int CFileServer::Register(unsigned int clientId, const CFileRef* ref)
{
    if (clientId == 0 || !isExistingFile(ref))
        return kRefused;
    if (TContainer* known = Find(ref)) {
        AddClientId(clientId);
        return Retain(clientId, *known);
    }
    if (maxFiles_ <= 0 || files_.size() >= static_cast<std::size_t>(maxFiles_))
        return kRefused;
    auto container = std::make_unique<TContainer>();
    container->ref = *ref;
    if (!Open(ref, *container, ref->HasExtension(kUnloadedExtension)))
        return 0;
    container->clientIds = {clientId};
    AddClientId(clientId);
    files_.set(ref->URL(), container.release());
    return 1;
}

unsigned int CFileServer::UnRegister(unsigned int clientId)
{
    std::erase(clientIds_, clientId);
    refs_.clear();
    for (TContainer* container : files_)
        if (Release(clientId, *container) == 0) {
            Close(*container);
            refs_.push_back(container->ref);
        }
    for (const CFileRef& ref : refs_)
        files_.remove(ref.URL());
    refs_.clear();
    return 0;
}

bool CFileServer::Open(const CFileRef* ref, TContainer& container, bool skipSamples)
{
    CAudioFileIO file;
    if (ref == nullptr || file.Open(*ref, 0) != kStatusOK)
        return false;
    Close(container);
    if (skipSamples)
        return true;
    LoadedSamples loaded;
    if (!LoadSamples(file, loaded))
        return false;
    container.samples = std::move(loaded.samples);
    container.sampleRate = static_cast<float>(file.Info().sampleRate);
    container.channels = loaded.channels;
    container.frames = loaded.frames;
    return true;
}

void CFileServer::Close(TContainer& container)
{
    container.samples.reset();
}

unsigned int CFileServer::Retain(unsigned int clientId, TContainer& container)
{
    if (!contains(container.clientIds, clientId))
        container.clientIds.push_back(clientId);
    return static_cast<unsigned int>(container.clientIds.size());
}

unsigned int CFileServer::Release(unsigned int clientId, TContainer& container)
{
    std::erase(container.clientIds, clientId);
    return static_cast<unsigned int>(container.clientIds.size());
}

TFileInfo CFileServer::GetFileInfo(const CFileRef* ref) const
{
    const TContainer* container = Find(ref);
    return container != nullptr ? infoOf(*container) : TFileInfo();
}

const std::vector<TFileInfo>& CFileServer::GetFileInfoVector(unsigned int clientId)
{
    fileInfos_.clear();
    for (const TContainer* container : files_)
        if (contains(container->clientIds, clientId))
            fileInfos_.push_back(infoOf(*container));
    return fileInfos_;
}

/// Kept: a stereo file that is held as mono differs in its channels from every file, so it never matches.
TContainer* CFileServer::FindReplaced(const CFileRef& newFile, const char* name) const
{
    if (newFile.HasExtension(kUnloadedExtension))
        return nullptr;
    CAudioFileIO file;
    for (TContainer* container : files_) {
        if (container->ref.CopyFileName().utf8() != name)
            continue;
        if (!file.IsOpen() && (file.Open(newFile, 0) != kStatusOK || file.OpenDecoder() != kStatusOK))
            return nullptr;
        const AudioFileInfo& info = file.Info();
        if (static_cast<float>(info.sampleRate) == container->sampleRate &&
            static_cast<std::uint32_t>(info.channels) == container->channels && info.frames == container->frames)
            return container;
    }
    return nullptr;
}

std::vector<unsigned int> CFileServer::UpdateAudioFileInfo(const CFileRef* newFile, CFileRef& oldFile)
{
    constexpr long nameSize = 1024;
    char name[nameSize];
    const bool isNew = newFile != nullptr && newFile->IsValid();
    TContainer* container = isNew && newFile->GetFileName(name, nameSize) ? FindReplaced(*newFile, name) : nullptr;
    if (container == nullptr)
        return {};
    const CFileRef replacement = *newFile; // the caller may pass the same reference for both
    if (const TContainer* holder = Find(&replacement); holder != nullptr && holder != container)
        return {}; // other clients read its samples
    oldFile = container->ref;
    kTContainerValueCallbacks.retain(container);
    files_.remove(oldFile.URL());
    container->ref = replacement;
    files_.set(replacement.URL(), container);
    std::vector<unsigned int> clients = container->clientIds;
    kTContainerValueCallbacks.release(container);
    return clients;
}

const TContainer* CFileServer::FirstOf(unsigned int clientId) const
{
    for (const TContainer* container : files_)
        if (contains(container->clientIds, clientId))
            return container;
    return nullptr;
}

const char* CFileServer::GetFileNameFromFirstRef(unsigned int clientId, bool keepExtension) const
{
    static std::array<char, 256> buffer;
    buffer.fill('\0');
    if (const TContainer* container = clientId != 0 ? FirstOf(clientId) : nullptr) {
        const std::string name =
            keepExtension ? container->ref.CopyFileName().utf8() : nameWithoutExtension(container->ref);
        name.copy(buffer.data(), buffer.size() - 1);
    }
    return buffer.data();
}

bool CFileServer::ClientIsRegistered(unsigned int clientId, std::vector<unsigned int>& ids) const
{
    return contains(ids, clientId);
}

unsigned int CFileServer::MaxClientId(std::vector<unsigned int>& ids) const
{
    return ids.empty() ? 0 : *std::max_element(ids.begin(), ids.end());
}

void CFileServer::SwapClients(unsigned int a, unsigned int b)
{
    for (TContainer* container : files_) {
        std::vector<unsigned int>& ids = container->clientIds;
        const auto first = std::find(ids.begin(), ids.end(), a);
        const auto second = std::find(ids.begin(), ids.end(), b);
        if (first != ids.end())
            *first = b;
        if (second != ids.end())
            *second = a;
    }
}
