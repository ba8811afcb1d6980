// How CFileIO opens and closes files.
#include "files/CFileIO.h"

#include "files/CFileUtil.h"
#include "platform/Bookmark.h"
#include "platform/SystemCalls.h"

#include <array>
#include <string_view>

namespace {

constexpr std::uint32_t kNewFilePermissions = 0644;
constexpr std::int64_t kLargestAliasFile = 8192; // a bookmark holds a path and little more

/// Whether an open file should be resolved as an alias instead. The length alone rules that out for nearly every audio
/// file, so that opening one costs no read.
bool IsAliasFile(int descriptor, const platform::FileStatus& status)
{
    if (status.size == 0 || status.size > kLargestAliasFile)
        return false;
    std::array<std::byte, 64> start;
    const std::int64_t got = platform::systemCalls().pread(descriptor, start.data(), start.size(), 0);
    return got > 0 && platform::looksLikeBookmark(BytesView(start).first(static_cast<std::size_t>(got)));
}

/// Whether "." or ".." is a component of the path, which then differs from the path of the item that it leads to.
bool HasDots(std::string_view path)
{
    for (std::size_t at = path.find("/."); at != path.npos; at = path.find("/.", at + 1)) {
        const std::string_view behind = path.substr(at + 2, 2);
        if (behind.empty() || behind[0] == '/' || behind == "." || behind == "./")
            return true;
    }
    return false;
}

platform::OpenFor AccessOf(unsigned int mode)
{
    return (mode & kFileIOReadWrite) != 0 ? platform::OpenFor::readingAndWriting : platform::OpenFor::reading;
}

} // namespace

CFileIO::CFileIO(const CFileRef& ref, unsigned int mode)
{
    CFileIO::Open(ref, mode);
}

CFileIO::~CFileIO()
{
    CFileIO::Close();
}

void CFileIO::Init()
{
    CloseDescriptor();
    DeAllocWCache();
    ResetCache();
    mark_ = 0;
    CFileRef::ReInit();
}

std::int32_t CFileIO::Open(const CFileRef& ref, unsigned int mode)
{
    if (&ref == this) {
        const CFileRef copy(ref);
        return CFileIO::Open(copy, mode);
    }
    FlushWCache();
    DeAllocWCache();
    ForgetPosition();
    CloseDescriptor();
    CFileRef::ReInit();

    if ((mode & kFileIOMemory) != 0) {
        if (!cache_)
            cache_ = std::make_shared<KTMem>();
        cacheLength_ = static_cast<long long>(cache_->size());
        stampAtOpen_ = {cacheLength_, 0};
        mode_ = mode;
        return kStatusOK;
    }
    const std::int32_t status = OpenFile(ref, mode);
    if (status != kStatusOK)
        CFileRef::ReInit();
    return status;
}

/// Opening a path without links or dots proves in one call that there is nothing to resolve, that the file exists and
/// that it is no folder. If that fails, the steps are taken one by one.
std::int32_t CFileIO::OpenFile(const CFileRef& ref, unsigned int mode)
{
    const platform::SystemCalls& system = platform::systemCalls();
    if (const char* path = ref.GetPath(); path != nullptr && !HasDots(path)) {
        platform::FileStatus status;
        const int descriptor = system.openFileWithoutLinks(path, AccessOf(mode), &status);
        if (descriptor >= 0) {
            if (!IsAliasFile(descriptor, status)) {
                CFileRef::operator=(ref);
                Adopt(descriptor, {status.size, status.changed}, mode);
                return kStatusOK;
            }
            system.close(descriptor);
        }
    }
    return OpenStepByStep(ref, mode);
}

std::int32_t CFileIO::OpenStepByStep(const CFileRef& ref, unsigned int mode)
{
    CFileRef::operator=(ref);
    ResolveAlias((mode & kFileIOInteraction) != 0);
    if (!Exists()) {
        if ((mode & kFileIOReadWrite) == 0)
            return kStatusFileNotFound;
        const std::int32_t status = CFileUtilCreate(*this, 0, 0, kNewFilePermissions);
        if (status != kStatusOK)
            return status;
    }
    if (IsFolder())
        return kStatusParameterError;
    const char* path = GetPath();
    if (path == nullptr)
        return kStatusParameterError;

    platform::FileStatus status;
    const int descriptor = platform::systemCalls().openFile(path, AccessOf(mode), &status);
    if (descriptor < 0)
        return PosixErrorToOSErr();
    Adopt(descriptor, {status.size, status.changed}, mode);
    return kStatusOK;
}

void CFileIO::Adopt(int descriptor, const FileStamp& stamp, unsigned int mode)
{
    descriptor_ = descriptor;
    stampAtOpen_ = stamp;
    mode_ = mode;
    HintAtNoReuse(stamp.length);
}

std::int32_t CFileIO::Close()
{
    const std::int32_t flushed = FlushWCache();
    DeAllocWCache();
    cacheOffset_ = cacheLength_ = 0;
    const std::int32_t closed = CloseDescriptor();
    CFileRef::ReInit();
    return flushed != kStatusOK ? flushed : closed;
}

/// Not retried after a failure: even after an interruption the descriptor is gone.
std::int32_t CFileIO::CloseDescriptor()
{
    std::int32_t status = kStatusOK;
    if (descriptor_ >= 0 && platform::systemCalls().close(descriptor_) != 0)
        status = PosixErrorToOSErr();
    descriptor_ = -1;
    mode_ = 0;
    stampAtOpen_ = {};
    isHinted_ = false;
    return status;
}

void CFileIO::ForgetPosition()
{
    mark_ = 0;
    cacheOffset_ = cacheLength_ = 0;
}
