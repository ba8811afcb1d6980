// ktfiles meta: what files say about themselves. Its objects are in files of their own.
#pragma once

class CommandLine;
class Verb;

/// "set" and "remove".
void declareMetaEdits(CommandLine& commandLine, Verb& meta);
