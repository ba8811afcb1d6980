// The objects of the verb `index`.
#pragma once

class CommandLine;
class Verb;

/// `index export`
void declareIndexExport(CommandLine& commandLine, Verb& index);
/// `index merge`
void declareIndexMerge(CommandLine& commandLine, Verb& index);
