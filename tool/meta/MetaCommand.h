// What the verbs below `ktfiles meta` share.
#pragma once

#include "audiofile/fields/FileMetadata.h"

class CommandLine;
class Verb;

/// `meta set` and `meta remove`.
void declareMetaEdits(CommandLine& commandLine, Verb& meta);
void declareMetaCopy(CommandLine& commandLine, Verb& meta);
void declareMetaExport(CommandLine& commandLine, Verb& meta);
void declareMetaImport(CommandLine& commandLine, Verb& meta);

/// "bext,ixml" as groups; what is no group may be the id of a chunk. Throws UsageError.
MetaGroups metaGroupsFromText(const std::string& text);
