// ktfiles chunks: lists what containers hold. Its objects have files of their own.
#pragma once

class CommandLine;
class Verb;

void declareChunksGet(CommandLine& commandLine, Verb& chunks);
/// Declares "add" and "remove".
void declareChunkEdits(CommandLine& commandLine, Verb& chunks);
