// ktfiles locks: lists who presents, holds and awaits files.
#include "tool/lock/ItemNames.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/access/Parties.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

namespace {

using platform::CoordinationParty;

const char* roleText(CoordinationParty::Role role)
{
    switch (role) {
    case CoordinationParty::Role::presents:
        return "presents";
    case CoordinationParty::Role::holds:
        return "holds";
    default:
        return "waits";
    }
}

class PartiesWriter {
public:
    explicit PartiesWriter(const OutputOptions& options)
        : form_(outputForm(options)),
          color_(usesColor(options.color)),
          json_(options)
    {
    }

    /// `path` is empty if only the item's number is known.
    void add(const std::string& path, const CoordinationParty& party)
    {
        const std::string name = processName(party.processID);
        const char* const role = roleText(party.role);
        const char* const access = party.isWriting ? "write" : "read";
        const std::string item = path.empty() ? fmt::format("item:{:012x}", party.itemNumber) : printable(path);
        if (form_ == Form::json) {
            JsonWriter& json = json_.begin();
            json.beginObject().knownMember("path", path).member("item", party.itemNumber).member("role", role);
            json.member("access", access).member("processID", party.processID).knownMember("command", name);
            json.endObject();
            json_.end();
        } else if (form_ == Form::table) {
            table_.add({item, role, access, std::to_string(party.processID), printable(name)});
        } else if (form_ == Form::lines) {
            output_.print("{}\t{}\t{}\t{}\t{}\n", item, role, access, party.processID, printable(name));
        }
    }

    void addFailure(const std::string& path, const std::string& text) { json_.addFailure(path, text); }

    void finish()
    {
        json_.finish();
        table_.print(output_, color_);
    }

private:
    Form form_;
    bool color_;
    Output& output_ = Output::standard();
    JsonRecords json_;
    Table table_{{{.title = "FILE", .isCuttable = true},
                  {.title = "ROLE"},
                  {.title = "ACCESS", .dropRank = 2},
                  {.title = "PROCESS", .align = Align::right},
                  {.title = "COMMAND", .dropRank = 1, .isCuttable = true}}};
};

std::vector<CoordinationParty> allParties()
{
    platform::Error error;
    auto parties = platform::coordinationParties(&error);
    if (!error.description.empty())
        throw Failure(error.description);
    return parties;
}

bool listFiles(const std::vector<std::string>& files, PartiesWriter& writer)
{
    const auto parties = allParties();
    bool good = true;
    for (const std::string& path : files) {
        try {
            const auto number = platform::coordinationItemNumber(fileLocation(path));
            for (const CoordinationParty& party : parties)
                if (party.itemNumber == number)
                    writer.add(path, party);
        } catch (const Failure& failure) {
            good = false;
            writer.addFailure(path, failure.what());
            reportFailure(path, failure.what());
        }
    }
    return good;
}

bool runLocks(const std::vector<std::string>& files, const OutputOptions& options)
{
    PartiesWriter writer(options);
    bool good = true;
    const bool listed = reportingFailures("locks", [&] {
        if (!files.empty()) {
            good = listFiles(files, writer);
            return;
        }
        const auto parties = allParties();
        const auto names = itemNames(parties);
        for (const CoordinationParty& party : parties) {
            const auto name = names.find(party.itemNumber);
            writer.add(name == names.end() ? std::string() : name->second, party);
        }
    });
    writer.finish();
    return listed && good;
}

void declareLocks(CommandLine& commandLine)
{
    static std::vector<std::string> files;
    Verb& verb = commandLine.addVerb("locks", "List who presents, holds and waits for files, by process",
                                     [&commandLine] { return runLocks(files, commandLine.output()); });
    CommandLine::addFiles(verb, files).describe("The files; else all");
}

const VerbRegistration locksRegistration{80, "locks", declareLocks};

} // namespace
