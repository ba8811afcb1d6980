// Bytes as an ADM document, strictly and with everything let pass: a result, or one of the named exceptions.
#include "adm/ADMDocument.h"

#include <cstdint>
#include <cstdlib>

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

template <class Table>
void visit(ADMDocument& document, const Table& table)
{
    for (const ADMElement& element : table) {
        element.description();
        require(table.find(element.elementID()) == &element);
        try {
            document.findADMElementRef(element.elementID());
        } catch (const ADMException&) {
            // An ID that is spelt as no other of its kind is.
        }
    }
}

bool parse(BytesView bytes, const ADMDocumentOptions& options, std::size_t& diagnostics)
{
    const auto document = ADMDocument::initWithADMData(Bytes(bytes.begin(), bytes.end()));
    document->setOptions(options);
    document->setDiagnosticsHandler([&](const ADMDiagnostic& diagnostic) {
        ++diagnostics;
        require(!diagnostic.kind.empty() && !diagnostic.text.empty());
    });
    bool isParsed = false;
    try {
        isParsed = document->parse();
        require(isParsed == (document->parseError() == nullptr));
        require(!isParsed || (document->currentElements().empty() && document->currentGenericElements().empty()));
    } catch (const ADMException& problem) {
        require(diagnostics > 0 && !problem.reason().empty());
    }
    visit(*document, document->audioProgrammes());
    visit(*document, document->audioContents());
    visit(*document, document->audioObjects());
    visit(*document, document->audioPackFormats());
    visit(*document, document->audioChannelFormats());
    visit(*document, document->audioStreamFormats());
    visit(*document, document->audioTrackFormats());
    visit(*document, document->audioTrackUIDs());
    return isParsed;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const BytesView bytes = std::as_bytes(std::span(data, size));
    std::size_t problems = 0, passed = 0;
    const bool isStrict = parse(bytes, {}, problems);
    const bool isLenient = parse(bytes, {true, true, true, true}, passed);
    require(!isStrict || (isLenient && problems == 0 && passed == 0));
    return 0;
}
