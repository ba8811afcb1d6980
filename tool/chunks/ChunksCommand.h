// ktfiles chunks: what containers hold. Its objects are in files of their own.
#pragma once

class CommandLine;
namespace CLI {
class App;
}

void declareChunksGet(CommandLine& commandLine, CLI::App& chunks);
/// "add" and "remove".
void declareChunkEdits(CommandLine& commandLine, CLI::App& chunks);
