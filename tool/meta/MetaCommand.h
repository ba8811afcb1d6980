// Shared by the objects of `ktfiles meta`.
#pragma once

#include "audiofile/fields/FileMetadata.h"

class CommandLine;
class Verb;

/// Declares `meta set` and `meta remove`.
void declareMetaEdits(CommandLine& commandLine, Verb& meta);
void declareMetaCopy(CommandLine& commandLine, Verb& meta);
void declareMetaExport(CommandLine& commandLine, Verb& meta);
void declareMetaImport(CommandLine& commandLine, Verb& meta);

/// Parses groups such as "bext,ixml"; an unknown group may be the id of a chunk. Throws UsageError.
MetaGroups metaGroupsFromText(const std::string& text);
