// The library's metadata for files named on the command line; its errors become Failures.
#pragma once

#include "audiofile/fields/FileMetadata.h"

#include <string>

/// As ReadMetadataFields; throws Failure, for files that are no audio the same as `info`.
FileMetadata readMetadata(const std::string& path, const MetaGroups& groups);
/// As HoldMetadata; throws Failure.
HeldMetadata holdMetadata(const std::string& path, const MetaGroups& groups = {});
