// ktfiles chunks: what containers hold. Its objects are in files of their own.
#pragma once

class CommandLine;
class Verb;

void declareChunksGet(CommandLine& commandLine, Verb& chunks);
/// "add" and "remove".
void declareChunkEdits(CommandLine& commandLine, Verb& chunks);
