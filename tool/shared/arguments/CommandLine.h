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

    /// A verb, or with `parent` an object of one. `run` does the work after parsing and tells whether all went well; it
    /// may throw a UsageError for a combination of arguments that makes no sense.
    Verb& addVerb(const std::string& name, const std::string& description, Verb::Work run, Verb* parent = nullptr);
    const OutputOptions& output() const { return output_; }

    // Arguments that verbs have in common. The values must outlive the parsing.
    static Argument addFile(Verb& verb, std::string& file, const std::string& name = "FILE");
    /// Also "-", for standard input.
    static Argument addFileOrInput(Verb& verb, std::string& file);
    static Argument addFiles(Verb& verb, std::vector<std::string>& files, const std::string& name = "FILE");
    /// Also folders, and lists by the options --files-from and -0. That there is a name at all is seen by `allNames`.
    static Argument addFiles(Verb& verb, FileArguments& files, const std::string& name = "FILE");
    /// Also "-", for standard input.
    static Argument addFilesOrInput(Verb& verb, FileArguments& files);
    static void addFileList(Verb& verb, FileArguments& files);
    /// "--csv", of verbs whose records are flat.
    Argument addCsv(Verb& verb);
    static Argument addChunkId(Verb& verb, FourCC& id);
    /// An option whose value names a file; "-" stands for standard input or output.
    static Argument addPath(Verb& verb, const std::string& name, std::string& path, const std::string& description);
    /// "--force", of verbs that write files of the user's choice.
    static void addForceOption(Verb& verb, OutputFile::Existing& existing);
    static void addEditOptions(Verb& verb, EditOptions& options);

    /// The exit status when the verb's work tells that not all went well, in the place of kExitFailed.
    void setFailureStatus(int status) { failureStatus_ = status; }

    /// Parses and does what is asked; the exit status of the process.
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

/// Joins the list of verbs from a file of their own: `const VerbRegistration registration{10, "info", declareInfo};`
class VerbRegistration {
public:
    /// `rank` orders the verbs in the help. `declare` adds the verb under its name.
    VerbRegistration(int rank, const char* name, void (*declare)(CommandLine&));
    /// The verb of that name alone, since declaring all takes a third of the time of a short run; all of them when
    /// there is none.
    static void declareNamed(CommandLine& commandLine, std::string_view name);
};
