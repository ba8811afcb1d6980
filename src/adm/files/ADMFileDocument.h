// The ADM document of a file in one call: as a graph of elements, or as JSON.
#pragma once

#include "adm/ADMDocument.h"
#include "adm/files/ADMSource.h"

#include <memory>
#include <optional>
#include <string>

/// Of an XML file, or of the chunk "axml" of an audio file. Null where there is none, and for a document that breaks a
/// rule which the options do not let pass (ADMFileError).
KT_EXPORT std::unique_ptr<ADMDocument> readADMDocument(const CFileRef& file, const ADMDocumentOptions& options = {},
                                                       platform::Error* error = nullptr);

/// The same as writeADMJson writes it, without diagnostics; `name` becomes the member "path".
KT_EXPORT std::optional<std::string> readADMDocumentAsJson(const CFileRef& file, const std::string& name,
                                                           const ADMDocumentOptions& options = {},
                                                           platform::Error* error = nullptr);
