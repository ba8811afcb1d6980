// ADM documents as JSON.
#include "adm/files/ADMFileDocument.h"
#include "c/Calls.h"

#include <cstdlib>

namespace {

ktf_status failForDocument(const char* path, const platform::Error& error)
{
    if (error.domain != kADMErrorDomain)
        return failCallByError(path, error);
    switch (static_cast<ADMFileError>(error.code)) {
    case ADMFileError::unknownFile:
    case ADMFileError::otherFile:
        return failCall(path, KTF_NOT_SUPPORTED, error.description);
    case ADMFileError::noChunk:
        return failCall(path, KTF_NOT_THERE, error.description);
    case ADMFileError::badChunk:
        return failCall(path, KTF_END_OF_FILE, error.description);
    case ADMFileError::badDocument:
        break;
    }
    return failCall(path, KTF_FAILED, error.description);
}

} // namespace

ktf_status ktf_adm_json(const char* path, char** text, std::size_t* size)
{
    if (text != nullptr)
        *text = nullptr;
    if (size != nullptr)
        *size = 0;
    if (path == nullptr || text == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        const platform::URLRef location = locationOfPath(path);
        if (!location)
            return failCall(path, KTF_FILE_NOT_FOUND);
        platform::Error error;
        const std::optional<std::string> json = readADMDocumentAsJson(CFileRef(location), path, {}, &error);
        if (!json)
            return failForDocument(path, error);
        auto* const memory = static_cast<char*>(std::malloc(json->size() + 1));
        if (memory == nullptr)
            return failCall(path, KTF_OUT_OF_MEMORY);
        std::memcpy(memory, json->c_str(), json->size() + 1);
        *text = memory;
        if (size != nullptr)
            *size = json->size();
        return KTF_OK;
    });
}
