// ktfiles pair: the stereo pairs among files that are kept as two mono halves, and the halves that miss their partner.
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileFacts.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
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

class PairWriter {
public:
    explicit PairWriter(const OutputOptions& options) : form_(outputForm(options)), color_(usesColor(options.color)) {}

    void add(const Pair& pair)
    {
        if (form_ == Form::json)
            json_.next()
                .beginObject()
                .member("left", pair.left)
                .member("right", pair.right)
                .member("leftExists", pair.hasLeft)
                .member("rightExists", pair.hasRight)
                .endObject();
        else if (form_ == Form::table)
            table_.add({printable(pair.left), printable(pair.right), stateOf(pair)});
        else if (form_ == Form::lines)
            output_.print("{}\t{}\t{}\n", printable(pair.left), printable(pair.right), stateOf(pair));
    }

    void finish()
    {
        if (form_ == Form::json)
            json_.finish();
        table_.print(output_, color_);
    }

private:
    Form form_;
    bool color_;
    Output& output_ = Output::standard();
    JsonRecords json_;
    Table table_{{{"LEFT"}, {"RIGHT"}, {"STATE"}}};
};

bool runPair(const std::vector<std::string>& files, const OutputOptions& options)
{
    PairWriter writer(options);
    std::set<std::string> seen; // halves that were listed
    std::vector<std::pair<std::string, std::string>> problems;
    FolderWalk walk(files, [&](const std::string& path, const std::string& problem) {
        const std::optional<StereoHalf> half = stereoHalf(path);
        if (!problem.empty()) {
            problems.emplace_back(path, problem);
        } else if (half && seen.insert(path).second) {
            seen.insert(half->partner);
            const bool isLeft = half->isLeft, hasPartner = half->partnerExists;
            writer.add({isLeft ? path : half->partner, isLeft ? half->partner : path, isLeft || hasPartner,
                        !isLeft || hasPartner});
        }
        return !Output::standard().failed();
    });
    walk.run();
    writer.finish();
    Output::standard().flush(); // ahead of what follows on standard error
    for (const auto& [path, problem] : problems)
        reportFailure(path, problem);
    return problems.empty();
}

void declarePair(CommandLine& commandLine)
{
    static std::vector<std::string> files;
    Verb& verb = commandLine.addVerb("pair", "List stereo pairs of mono files, and halves without their partner",
                                     [&commandLine] { return runPair(files, commandLine.output()); });
    CommandLine::addFiles(verb, files).required().describe("The files, and folders of them");
}

const VerbRegistration registration{15, declarePair};

} // namespace
