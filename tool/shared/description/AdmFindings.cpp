#include "tool/shared/description/AdmFindings.h"

#include "media/containers/ContainerCheck.h"
#include "tool/shared/adm/AdmFile.h"
#include "tool/shared/adm/AdmTracks.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>

namespace {

/// Null if the document was not read to its end; `problem` says why.
std::unique_ptr<ADMDocument> readDocument(ADMSource& source, ADMDiagnostic& problem)
{
    auto document = std::make_unique<ADMDocument>(nullptr);
    document->setOptions({.continuePastUnresolvedReferences = true, .skipUnsupportedBlocks = true});
    document->setDiagnosticsHandler([&problem](const ADMDiagnostic& told) { problem = told; });
    const auto stream = source.stream();
    bool isComplete = false;
    try {
        isComplete = document->parseStream(*stream);
    } catch (const ADMException&) { // the handler has received it
    }
    document->setDiagnosticsHandler(nullptr);
    if (const platform::Error* error = document->parseError();
        error != nullptr && error->domain == platform::ErrorDomain::status)
        throw Failure(error->description);
    return isComplete ? std::move(document) : nullptr;
}

} // namespace

std::vector<AdmFinding> admFindings(const std::string& path, const AdmChunks& chunks)
{
    const auto source = openAdm(path, ADMSource::Document::mayLack);
    std::unique_ptr<ADMDocument> document;
    std::vector<AdmFinding> findings;
    if (source->hasDocument() && chunks.document) {
        ADMDiagnostic problem;
        document = readDocument(*source, problem);
        if (!document)
            findings.push_back(
                {"documentIsBroken", fourCC("axml"), chunks.document->offset,
                 fmt::format("cannot be read beyond its line {}: {}", problem.position.line, problem.text),
                 "renderers refuse the file, or take it for one without ADM"});
    }
    const ChunkEntry& place = chunks.tracks ? *chunks.tracks : *chunks.document;
    std::vector<ADMDiagnostic> problems = trackProblems(*source, document.get());
    problems.resize(std::min(problems.size(), platform::kMostFindings));
    for (const ADMDiagnostic& problem : problems)
        findings.push_back({"tracksDiffer", place.id, place.offset, "is off: " + problem.text,
                            "renderers leave tracks out, or refuse the file"});
    return findings;
}
