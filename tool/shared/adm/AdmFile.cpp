#include "tool/shared/adm/AdmFile.h"

#include "tool/shared/input/FoundFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

std::unique_ptr<ADMSource> openAdm(const std::string& path, ADMSource::Document document)
{
    platform::Error error;
    if (auto source = ADMSource::open(referenceTo(path), document, &error))
        return source;
    const auto is = [&error](ADMFileError code) {
        return error.domain == kADMErrorDomain && error.code == static_cast<std::int64_t>(code);
    };
    if (is(ADMFileError::unknownFile) || (is(ADMFileError::otherFile) && isCalledContainer(path)))
        throw OtherKind(error.description, OtherKind::Kind::unknown);
    if (is(ADMFileError::noChunk) || is(ADMFileError::otherFile))
        throw OtherKind(error.description, OtherKind::Kind::audio);
    throw Failure(error.description);
}
