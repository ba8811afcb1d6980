#include "c/Calls.h"

#include "platform/core/FourCC.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <new>
#include <string>
#include <utility>

namespace {

/// The statuses of the library go through as they are.
constexpr std::pair<std::int32_t, std::int32_t> kSameStatuses[] = {
    {KTF_OK, kStatusOK},
    {KTF_INTERRUPTED, kStatusInterrupted},
    {KTF_DISK_FULL, kStatusDiskFull},
    {KTF_IO_ERROR, kStatusIOError},
    {KTF_BAD_NAME, kStatusBadName},
    {KTF_NOT_OPEN, kStatusNotOpen},
    {KTF_END_OF_FILE, kStatusEndOfFile},
    {KTF_BEFORE_START, kStatusBeforeStart},
    {KTF_OUT_OF_MEMORY, kStatusOutOfMemory},
    {KTF_TOO_MANY_OPEN_FILES, kStatusTooManyOpenFiles},
    {KTF_FILE_NOT_FOUND, kStatusFileNotFound},
    {KTF_BUSY, kStatusFileBusy},
    {KTF_DUPLICATE_NAME, kStatusDuplicateName},
    {KTF_PARAMETER_ERROR, kStatusParameterError},
    {KTF_BAD_REFERENCE, kStatusBadReference},
    {KTF_READ_ONLY, kStatusWritePermission},
    {KTF_CANCELLED, kStatusUserCancelled},
    {KTF_NOT_A_FILE, kStatusNotAFile},
    {KTF_DIFFERENT_VOLUME, kStatusDifferentVolume},
    {KTF_FILE_TOO_BIG, kStatusFileTooBig},
    {KTF_NOT_A_FOLDER, kStatusNotAFolder},
    {KTF_QUOTA_EXCEEDED, kStatusQuotaExceeded},
    {KTF_ACCESS_DENIED, kStatusAccessDenied},
    {KTF_AUTHENTICATION_ERROR, kStatusAuthenticationError},
};
static_assert(std::ranges::all_of(kSameStatuses, [](const auto& pair) { return pair.first == pair.second; }));

thread_local std::string lastError;

} // namespace

ktf_status failCall(const char* name, ktf_status status, std::string_view why)
{
    try {
        std::string text = name != nullptr ? std::string(name) + ": " : std::string();
        lastError = text.append(why.empty() ? std::string_view(ktf_status_text(status)) : why);
    } catch (const std::bad_alloc&) {
        lastError = "out of memory"; // short enough to need none
    }
    return status;
}

ktf_status failCallByException(const char* name)
{
    try {
        throw;
    } catch (const std::bad_alloc&) {
        return failCall(name, KTF_OUT_OF_MEMORY);
    } catch (const std::exception& exception) {
        return failCall(name, KTF_FAILED, exception.what());
    } catch (...) {
        return failCall(name, KTF_FAILED);
    }
}

ktf_status failCallByError(const char* name, const platform::Error& error)
{
    const std::int32_t status = NSErrorToOSErr(&error);
    return failCall(name, status != kStatusOK ? status : ktf_status{KTF_FAILED}, error.description);
}

ktf_status failCallByNull(const char* name)
{
    return failCall(name, KTF_PARAMETER_ERROR, "a null pointer was passed");
}

platform::URLRef locationOfPath(const char* path)
{
    std::error_code error;
    const std::filesystem::path absolute = std::filesystem::absolute(path, error);
    return error ? nullptr : platform::URL::createWithFileSystemBytes(absolute.native(), false);
}

const char* ktf_status_text(ktf_status status)
{
    switch (status) {
    case KTF_FAILED:
        return "failed";
    case KTF_NOT_SUPPORTED:
        return "format not supported";
    case KTF_NO_ROOM:
        return "buffer too small";
    case KTF_NOT_THERE:
        return "not there";
    case KTF_WOULD_LOSE:
        return "data would be lost";
    default:
        return StatusText(status);
    }
}

const char* ktf_last_error()
{
    return lastError.c_str();
}

std::uint32_t ktf_version()
{
    return KTF_VERSION;
}

char* ktf_code_text(std::uint32_t code, char text[KTF_CODE_TEXT_SIZE])
{
    if (text == nullptr)
        return nullptr;
    const std::string characters = fourCCText(code); // at most 16
    *std::ranges::copy(characters, text).out = '\0';
    return text;
}

void ktf_free(void* memory)
{
    std::free(memory);
}
