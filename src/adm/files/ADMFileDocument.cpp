#include "adm/files/ADMFileDocument.h"

#include "adm/ADMJson.h"
#include "platform/core/JsonWriter.h"

namespace {

/// What kept a document from being read.
struct Obstacle {
    ADMDiagnostic problem;                // the last that was told
    std::optional<platform::Error> error; // of reading the file
};

/// Null for a document that is broken; `obstacle` may be null.
std::unique_ptr<ADMDocument> parsed(ADMSource& source, const ADMDocumentOptions& options, Obstacle* obstacle)
{
    auto document = std::make_unique<ADMDocument>(nullptr);
    document->setOptions(options);
    if (obstacle != nullptr)
        document->setDiagnosticsHandler([obstacle](const ADMDiagnostic& told) { obstacle->problem = told; });
    const auto stream = source.stream();
    bool isComplete = false;
    try {
        isComplete = document->parseStream(*stream);
    } catch (const ADMException&) {
        // The handler has heard of it, and with its place.
    }
    document->setDiagnosticsHandler(nullptr);
    const platform::Error* const error = document->parseError();
    if (obstacle != nullptr && error != nullptr && error->domain == platform::ErrorDomain::status)
        obstacle->error = *error;
    return isComplete ? std::move(document) : nullptr;
}

} // namespace

std::unique_ptr<ADMDocument> readADMDocument(const CFileRef& file, const ADMDocumentOptions& options,
                                             platform::Error* error)
{
    const auto source = ADMSource::open(file, ADMSource::Document::isThere, error);
    if (source == nullptr)
        return nullptr;
    auto document = parsed(*source, options, nullptr);
    if (document != nullptr || error == nullptr)
        return document;
    // To know the place of everything costs time, which only documents with a problem pay.
    Obstacle obstacle;
    parsed(*source, options, &obstacle);
    const ADMDiagnostic& problem = obstacle.problem;
    if (obstacle.error)
        *error = *obstacle.error;
    else
        *error = {kADMErrorDomain,
                  static_cast<std::int64_t>(ADMFileError::badDocument),
                  problem.kind + ": " + problem.text,
                  nullptr,
                  {{"line", problem.position.line},
                   {"column", problem.position.column},
                   {"name", problem.kind},
                   {"elementID", problem.elementID}}};
    return nullptr;
}

std::optional<std::string> readADMDocumentAsJson(const CFileRef& file, const std::string& name,
                                                 const ADMDocumentOptions& options, platform::Error* error)
{
    const auto document = readADMDocument(file, options, error);
    if (document == nullptr)
        return std::nullopt;
    JsonWriter json;
    writeADMJson(json, name, *document, nullptr);
    return std::string(json.text());
}
