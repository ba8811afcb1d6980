// The grammar `ktfiles VERB [OBJECT] FILE… [options]`: parsing, help, exit statuses, and the list that verbs join.
#pragma once

#include "platform/core/FourCC.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/arguments/Verb.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

#include <string>
#include <vector>

/// Exit statuses of the command.
enum : int { kExitOK = 0, kExitFailed = 1, kExitUsage = 2 };

/// Owns the parser, and the options that every verb takes.
class CommandLine {
public:
    CommandLine();

    /// Adds a verb, or with `parent` an object of one. `run` does the work after parsing and returns whether it
    /// succeeded; it may throw UsageError for a combination of arguments that makes no sense.
    Verb& addVerb(const std::string& name, const std::string& description, Verb::Work run, Verb* parent = nullptr);
    const OutputOptions& output() const { return output_; }

    // Arguments that verbs share. The values must outlive the parsing.
    static Argument addFile(Verb& verb, std::string& file, const std::string& name = "FILE");
    /// Accepts "-" for standard input.
    static Argument addFileOrInput(Verb& verb, std::string& file);
    static Argument addFiles(Verb& verb, std::vector<std::string>& files, const std::string& name = "FILE");
    /// Accepts folders too, and lists with the options --files-from and -0. `allNames` checks that there is at least
    /// one name.
    static Argument addFiles(Verb& verb, FileArguments& files, const std::string& name = "FILE");
    /// Accepts "-" for standard input too.
    static Argument addFilesOrInput(Verb& verb, FileArguments& files);
    static void addFileList(Verb& verb, FileArguments& files);
    /// "--csv", for verbs whose records are flat.
    Argument addCsv(Verb& verb);
    static Argument addChunkId(Verb& verb, FourCC& id);
    /// An option whose value names a file; "-" stands for standard input or output.
    static Argument addPath(Verb& verb, const std::string& name, std::string& path, const std::string& description);
    /// "--force", for verbs that write files of the user's choice.
    static void addForceOption(Verb& verb, OutputFile::Existing& existing);
    static void addEditOptions(Verb& verb, EditOptions& options);

    /// Sets the exit status for work that did not succeed, in place of kExitFailed.
    void setFailureStatus(int status) { failureStatus_ = status; }

    /// Parses the arguments and runs the verb; returns the exit status of the process.
    int run(int argc, char** argv);

private:
    void addOutputOptions(Verb& verb);
    void declareVerbs(const std::vector<std::string>& arguments);
    bool printHelp() const;
    UsageError unknownVerb(const std::string& word) const;
    int parseAndRun(const std::vector<std::string>& arguments);

    Verb program_;
    OutputOptions output_;
    int failureStatus_ = kExitFailed;
    std::vector<std::string> helpTopics_;
};

/// Adds a verb to the list from its own file: `const VerbRegistration registration{10, "info", declareInfo};`
class VerbRegistration {
public:
    /// `rank` orders the verbs in the help. `declare` adds the verb under its name.
    VerbRegistration(int rank, const char* name, void (*declare)(CommandLine&));
    /// Declares only the verb with that name, because declaring all takes a third of the time of a short run; all of
    /// them if there is none.
    static void declareNamed(CommandLine& commandLine, std::string_view name);
};
