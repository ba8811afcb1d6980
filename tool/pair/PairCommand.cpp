// ktfiles pair: lists stereo pairs among files that are two mono halves, and halves without a partner.
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileFacts.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/Table.h"

#include <set>

namespace {

struct Pair {
    std::string left, right;
    bool hasLeft, hasRight;
};

const char* stateOf(const Pair& pair)
{
    return pair.hasLeft && pair.hasRight ? "pair" : pair.hasLeft ? "right missing" : "left missing";
}

constexpr const char* kPairColumns[] = {"left", "right", "leftExists", "rightExists", "path", "error"};

class PairWriter {
public:
    explicit PairWriter(const OutputOptions& options)
        : form_(outputForm(options)),
          color_(usesColor(options.color)),
          records_(options, kPairColumns)
    {
    }

    void add(const Pair& pair)
    {
        if (form_ == Form::json || form_ == Form::csv) {
            Record record;
            record.member("left", pair.left).member("right", pair.right);
            records_.add(record.member("leftExists", pair.hasLeft).member("rightExists", pair.hasRight));
        } else if (form_ == Form::table) {
            table_.add({printable(pair.left), printable(pair.right), stateOf(pair)});
        } else if (form_ == Form::lines) {
            output_.print("{}\t{}\t{}\n", printable(pair.left), printable(pair.right), stateOf(pair));
        }
    }

    void addFailure(const std::string& path, const std::string& text) { records_.addFailure(path, text); }

    void finish()
    {
        records_.finish();
        table_.print(output_, color_);
    }

private:
    Form form_;
    bool color_;
    Output& output_ = Output::standard();
    DataRecords records_;
    Table table_{{{.title = "LEFT", .isCuttable = true}, {.title = "RIGHT", .isCuttable = true}, {.title = "STATE"}}};
};

bool runPair(const FileArguments& files, const OutputOptions& options)
{
    PairWriter writer(options);
    std::set<std::string> seen; // halves that were listed
    const auto add = [&](const FoundFile& file) -> FileRest {
        const std::optional<StereoHalf> half = stereoHalf(file.path);
        if (!half || !seen.insert(file.path).second)
            return [] {};
        seen.insert(half->partner);
        const bool isLeft = half->isLeft, hasPartner = half->partnerExists;
        const std::string own = shownName(file.path), partner = shownName(half->partner);
        writer.add({isLeft ? own : partner, isLeft ? partner : own, isLeft || hasPartner, !isLeft || hasPartner});
        return [] {};
    };
    const bool good =
        forEachFile(files, {.quiet = options.quiet}, add,
                    [&](const std::string& path, const std::string& text) { writer.addFailure(path, text); });
    writer.finish();
    return good;
}

void declarePair(CommandLine& commandLine)
{
    static FileArguments files;
    Verb& verb = commandLine.addVerb("pair", "List stereo pairs of mono files, and halves without their partner",
                                     [&commandLine] { return runPair(files, commandLine.output()); });
    CommandLine::addFiles(verb, files).describe("The files, and folders of them");
    commandLine.addCsv(verb);
}

const VerbRegistration pairRegistration{15, "pair", declarePair};

} // namespace
