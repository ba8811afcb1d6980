// ktfiles tags: what loops say of themselves. Its objects are in files of their own.
#pragma once

class CommandLine;
namespace CLI {
class App;
}

void declareTagsSet(CommandLine& commandLine, CLI::App& tags);
void declareTagsRemove(CommandLine& commandLine, CLI::App& tags);
void declareTagsCopy(CommandLine& commandLine, CLI::App& tags);
