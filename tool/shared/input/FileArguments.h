// The files that stand for FILE... in the grammar: files, folders with audio files, and lists of both.
#pragma once

#include <string>
#include <vector>

struct FileArguments {
    std::vector<std::string> names;
    std::string list;            // a file with further names, "-" for standard input; empty if none
    bool isNulSeparated = false; // of names in the list; otherwise one per line

    std::string label = "FILE"; // their name in the grammar
    bool takesInput = false;    // accepts "-" for standard input
    bool takesFolders = true;   // otherwise folders are refused when they are opened

    /// The list's name in messages.
    std::string listName() const { return list == "-" ? "standard input" : list; }
    /// Whether there may be several files, so that each line must name its file.
    bool maybeSeveral() const;
};

/// Throws UsageError for "-".
void requireNoInput(const std::string& name);

/// The names on the command line, followed by those in the list. Throws MissingArgument if there are neither, Failure,
/// which concerns the list, if it cannot be read or names no file, and UsageError for "-" if that is not accepted or is
/// the list already.
std::vector<std::string> allNames(const FileArguments& files);
