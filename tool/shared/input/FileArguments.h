// What stands where the grammar has FILE...: files, folders for the audio files below them, and lists of both.
#pragma once

#include <string>
#include <vector>

struct FileArguments {
    std::vector<std::string> names;
    std::string list;            // a file of further names, "-" for standard input; empty: none
    bool isNulSeparated = false; // the names in the list; else one stands on a line

    std::string label = "FILE"; // what the grammar calls them
    bool takesInput = false;    // "-" for standard input
    bool takesFolders = true;   // else they are files like any other, which are refused when they are opened

    /// What messages about the list call it.
    std::string listName() const { return list == "-" ? "standard input" : list; }
    /// Whether more files than one may come, so that each line says which it is about.
    bool maybeSeveral() const;
};

/// Throws UsageError for "-".
void requireNoInput(const std::string& name);

/// The names on the command line, and then those of the list. Throws MissingArgument when there is neither, and
/// Failure, which is about the list, for one that cannot be read or names no file. UsageError for "-" where that
/// is not taken, or is the list already.
std::vector<std::string> allNames(const FileArguments& files);
