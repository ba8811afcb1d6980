// ktfiles tags: shows the tags of loops. Its objects have files of their own.
#pragma once

class CommandLine;
class Verb;

void declareTagsSet(CommandLine& commandLine, Verb& tags);
void declareTagsRemove(CommandLine& commandLine, Verb& tags);
void declareTagsCopy(CommandLine& commandLine, Verb& tags);
