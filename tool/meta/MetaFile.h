// The library's metadata of files that are named on the command line, with its errors as Failures.
#pragma once

#include "audiofile/fields/FileMetadata.h"

#include <string>

/// As ReadMetadataFields; throws Failure, for what is no audio file that of `info`.
FileMetadata readMetadata(const std::string& path, const MetaGroups& groups);
/// As HoldMetadata; throws Failure.
HeldMetadata holdMetadata(const std::string& path, const MetaGroups& groups = {});
