// ktfiles tags: what loops say of themselves. Its objects are in files of their own.
#pragma once

class CommandLine;
class Verb;

void declareTagsSet(CommandLine& commandLine, Verb& tags);
void declareTagsRemove(CommandLine& commandLine, Verb& tags);
void declareTagsCopy(CommandLine& commandLine, Verb& tags);
