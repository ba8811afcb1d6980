// What files say about themselves, by field.
#include "audiofile/fields/FileMetadata.h"
#include "c/Calls.h"
#include "c/ValueText.h"

namespace {

ktf_status failForFields(const char* path, const platform::Error& error)
{
    if (error.domain != kMetadataErrorDomain)
        return failCallByError(path, error);
    const bool isUnreadable = error.code == static_cast<std::int64_t>(MetadataError::badHeader);
    return failCall(path, isUnreadable ? KTF_END_OF_FILE : KTF_NOT_SUPPORTED, error.description);
}

std::string textOf(const MetaField::Value& value)
{
    return std::visit(
        [](const auto& held) {
            if constexpr (requires { std::string(held); })
                return std::string(held);
            else
                return numberText(held);
        },
        value);
}

} // namespace

ktf_status ktf_each_field(const char* path, ktf_text_function function, void* context)
{
    if (path == nullptr || function == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        const platform::URLRef location = locationOfPath(path);
        if (!location)
            return failCall(path, KTF_FILE_NOT_FOUND);
        platform::Error error;
        const std::optional<FileMetadata> metadata = ReadMetadataFields(CFileRef(location), {}, &error);
        if (!metadata)
            return failForFields(path, error);
        for (const MetaField& field : metadata->fields)
            if (function(context, field.fullName().c_str(), textOf(field.value).c_str()) != 0)
                break;
        return KTF_OK;
    });
}
