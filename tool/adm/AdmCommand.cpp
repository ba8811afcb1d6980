// ktfiles adm: shows an ADM document as a tree or as JSON, and checks it.
#include "adm/ADMJson.h"
#include "tool/adm/AdmCheck.h"
#include "tool/adm/AdmTree.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/adm/AdmFile.h"
#include "tool/shared/adm/AdmText.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Progress.h"

#include <limits>
#include <utility>

namespace {

constexpr std::size_t kFewBlocks = 5;
constexpr std::size_t kFewDiagnostics = 10;

struct AdmArguments {
    FileArguments files;
    bool isLenient = false;
    bool isCheck = false;
    bool isLong = false;
    unsigned threads = 0;
};

/// A document, and the messages about it.
struct ReadDocument {
    std::unique_ptr<ADMDocument> document;
    std::vector<ADMDiagnostic> diagnostics;
    bool isComplete = false; // read to its end, which strict rules may prevent
};

ADMDocumentOptions optionsFor(const AdmArguments& arguments)
{
    // A check continues past problems where possible, to find the others.
    return {.continuePastUnresolvedReferences = arguments.isLenient || arguments.isCheck,
            .skipUnsupportedBlocks = arguments.isLenient || arguments.isCheck,
            .silentTrack = arguments.isLenient,
            .exactFractions = arguments.isLenient};
}

enum class Diagnose : bool { no, yes };

/// Throws a Failure if the file cannot be read, but not for problems of the document.
ReadDocument readFrom(ADMSource& source, const AdmArguments& arguments, bool quiet, Diagnose diagnose)
{
    ReadDocument read;
    read.document = std::make_unique<ADMDocument>(nullptr);
    read.document->setOptions(optionsFor(arguments));
    if (diagnose == Diagnose::yes)
        read.document->setDiagnosticsHandler([&read](const ADMDiagnostic& told) {
            read.diagnostics.push_back({told.position, told.kind, shortened(told.elementID), told.text});
        });
    Progress progress("reading", source.size(), quiet);
    std::uint64_t done = 0;
    read.document->setProgressHandler([&](std::uint64_t bytes) {
        progress.advance(static_cast<std::int64_t>(bytes - done));
        done = bytes;
        return true;
    });
    const auto stream = source.stream();
    try {
        read.isComplete = read.document->parseStream(*stream);
    } catch (const ADMException&) {
        // The handler has reported it, with its place.
    }
    read.document->setDiagnosticsHandler(nullptr);
    read.document->setProgressHandler(nullptr);
    if (const platform::Error* error = read.document->parseError();
        error != nullptr && error->domain == platform::ErrorDomain::status)
        throw Failure(error->description);
    return read;
}

std::string problemText(const ADMDiagnostic& diagnostic)
{
    return diagnostic.kind + ": " + diagnostic.text;
}

/// "FILE:LINE:COLUMN", the form that editors can jump to; the file alone if there is no place.
std::string placeText(const std::string& path, const ADMDiagnostic& diagnostic)
{
    if (diagnostic.position.line == 0)
        return path;
    return fmt::format("{}:{}:{}", path, diagnostic.position.line, diagnostic.position.column);
}

class AdmCommand {
public:
    AdmCommand(const AdmArguments& arguments, const OutputOptions& options)
        : arguments_(arguments),
          options_(options),
          form_(outputForm(options)),
          hasSeveral_(arguments.files.maybeSeveral()),
          json_(options)
    {
    }

    bool run()
    {
        bool areFine = true;
        // Documents report problems while they are read; a check holds its findings back.
        const FileLoop loop{
            .threads = arguments_.isCheck ? arguments_.threads : 1, .doing = "checking", .quiet = options_.quiet};
        const bool good = forEachFile(
            arguments_.files, loop,
            [&](const FoundFile& file) -> FileRest {
                if (!arguments_.isCheck)
                    return [this, &areFine, file] { areFine = show(file) && areFine; };
                return [this, &areFine, path = file.path, found = check(file)] {
                    tell(shownName(path), found);
                    areFine = areFine && found.empty();
                };
            },
            [&](const std::string& path, const std::string& text) { json_.addFailure(path, text); });
        json_.finish();
        return good && areFine;
    }

private:
    /// Throws OtherKind for an XML file below a folder that is no ADM: web pages begin with a tag, too.
    static void requireMeant(const FoundFile& file, const ADMSource& source)
    {
        if (file.isBelowFolder() && !source.isAudio())
            throw OtherKind("is XML, of any kind", OtherKind::Kind::unknown);
    }

    bool show(const FoundFile& file)
    {
        const std::string path = shownName(file.path);
        const FileAccess access = accessForReading(file.path, {.quiet = options_.quiet});
        const auto source = openAdm(file.path);
        requireMeant(file, *source);
        ReadDocument read = readDocument(*source, arguments_.isLenient ? Diagnose::yes : Diagnose::no);
        // Tracking positions takes a ninth longer, so only documents with a problem are read again for them.
        if (!read.isComplete && !arguments_.isLenient)
            read = readDocument(*source, Diagnose::yes);
        if (!read.isComplete) {
            const ADMDiagnostic last = read.diagnostics.back();
            read.diagnostics.pop_back();
            reportDiagnostics(path, read.diagnostics);
            return fail(path, last);
        }
        show(path, read);
        return true;
    }

    /// May be called by any thread.
    std::vector<ADMDiagnostic> check(const FoundFile& file) const
    {
        const FileAccess access = accessForReading(file.path, {.quiet = options_.quiet});
        const auto source = openAdm(file.path);
        requireMeant(file, *source);
        ReadDocument read = readDocument(*source, Diagnose::yes);
        for (ADMDiagnostic& problem : checkFurther(*source, *read.document, read.isComplete))
            read.diagnostics.push_back(std::move(problem));
        return std::move(read.diagnostics);
    }

    ReadDocument readDocument(ADMSource& source, Diagnose diagnose) const
    {
        return readFrom(source, arguments_, options_.quiet || hasSeveral_, diagnose);
    }

    bool fail(const std::string& path, const ADMDiagnostic& problem)
    {
        reportFailure(placeText(path, problem), problemText(problem));
        if (form_ == Form::json)
            json_.addFailure(path, problemText(problem));
        return false;
    }

    void tell(const std::string& path, const std::vector<ADMDiagnostic>& found)
    {
        if (form_ == Form::json) {
            JsonWriter& json = json_.begin();
            json.beginObject();
            json.member("path", path);
            json.key("problems");
            writeADMDiagnostics(json, found);
            json.endObject();
            json_.end();
        } else if (form_ != Form::none) {
            for (const ADMDiagnostic& diagnostic : found)
                output_.print("{}: {}\n", printable(placeText(path, diagnostic)), printable(problemText(diagnostic)));
        }
    }

    void show(const std::string& path, const ReadDocument& read)
    {
        if (form_ == Form::json) {
            writeADMJson(json_.begin(), path, *read.document, arguments_.isLenient ? &read.diagnostics : nullptr);
            json_.end();
            return;
        }
        if (form_ == Form::table) {
            output_.write(std::exchange(hasShown_, true) ? "\n" : "");
            showTitle(path, *read.document);
        }
        if (form_ != Form::none) {
            const bool isDrawn = form_ == Form::table;
            const bool isPrefixed = !isDrawn && hasSeveral_;
            AdmTreeWriter writer(output_, {.isDrawn = isDrawn,
                                           .hasColor = usesColor(options_.color),
                                           .hasBlockIDs = arguments_.isLong,
                                           .columns = terminalColumns(),
                                           .linePrefix = isPrefixed ? printable(path) + "\t" : ""});
            const bool hasAll = arguments_.isLong || !isDrawn;
            AdmTree(writer, hasAll ? std::numeric_limits<std::size_t>::max() - 1 : kFewBlocks).show(*read.document);
        }
        reportDiagnostics(path, read.diagnostics);
    }

    void showTitle(const std::string& path, const ADMDocument& document)
    {
        std::string text;
        const auto add = [&](std::size_t count, std::string_view noun) {
            if (count > 0)
                text += (text.empty() ? "" : ", ") + countText(count, noun);
        };
        std::size_t blocks = 0;
        for (const ADMAudioChannelFormat& channel : document.audioChannelFormats())
            blocks += channel.audioBlockFormat().size();
        add(document.audioProgrammes().size(), "programme");
        add(document.audioContents().size(), "content");
        add(document.audioObjects().size(), "object");
        add(document.audioTrackUIDs().size(), "track");
        add(document.audioChannelFormats().size(), "channel");
        add(blocks, "block");
        output_.print("{}: {}\n", printable(path), text.empty() ? "no ADM elements" : text);
    }

    /// Reports what was tolerated, on standard error, because standard output has a form of its own.
    void reportDiagnostics(const std::string& path, const std::vector<ADMDiagnostic>& diagnostics)
    {
        if (options_.quiet || diagnostics.empty())
            return;
        output_.flush();
        const bool hasAll = arguments_.isLong || form_ != Form::table || diagnostics.size() <= kFewDiagnostics + 1;
        const std::size_t count = hasAll ? diagnostics.size() : kFewDiagnostics;
        for (std::size_t i = 0; i < count; ++i)
            reportFailure(placeText(path, diagnostics[i]), problemText(diagnostics[i]));
        if (count < diagnostics.size())
            reportFailure(path, countText(diagnostics.size() - count, "more"));
    }

    const AdmArguments& arguments_;
    const OutputOptions& options_;
    Form form_;
    bool hasSeveral_;
    bool hasShown_ = false;
    Output& output_ = Output::standard();
    JsonRecords json_;
};

void declareAdm(CommandLine& commandLine)
{
    static AdmArguments arguments;
    Verb& verb = commandLine.addVerb("adm", "Show what the ADM documents of audio files, or in XML files, describe",
                                     [&commandLine] { return AdmCommand(arguments, commandLine.output()).run(); });
    CommandLine::addFilesOrInput(verb, arguments.files)
        .describe("Audio files, folders of them, and XML files; \"-\" is standard input");
    addThreads(verb, arguments.threads);
    verb.addFlag("--long", arguments.isLong, "Show every block, with its ID");
    verb.addFlag("--lenient", arguments.isLenient, "Let pass what can be passed over, and list it");
    verb.addFlag("--check", arguments.isCheck, "Print only what is wrong: FILE:LINE:COLUMN: NAME: REASON");
}

const VerbRegistration admRegistration{60, "adm", declareAdm};

} // namespace
