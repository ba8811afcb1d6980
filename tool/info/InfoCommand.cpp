// ktfiles info: describes audio files.
#include "audiofile/AudioDigest.h"
#include "platform/core/HexText.h"
#include "tool/info/InfoCheck.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/description/FileDescription.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileFacts.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"
#include "tool/shared/output/Table.h"

namespace {

std::string rateText(const AudioFileInfo& info)
{
    return fmt::format("{:.10g} kHz", info.exactSampleRate / 1000);
}

std::string channelsText(const AudioFileInfo& info)
{
    const std::string layout = layoutWord(info);
    if (!layout.empty())
        return layout;
    if (info.channels == 1)
        return "mono";
    return info.channels == 2 ? "stereo" : fmt::format("{} channels", info.channels);
}

std::string tracksText(const AudioFileInfo& info)
{
    return info.audioTracks > 1 ? fmt::format(", first of {} tracks", info.audioTracks) : "";
}

std::string lengthText(const AudioFileInfo& info)
{
    const std::string there = durationText(durationOf(info));
    const std::int64_t promised = promisedFrames(info);
    if (promised == 0 || info.exactSampleRate <= 0)
        return info.missingDataSize > 0 ? there + ", cut" : there;
    return fmt::format("{} of {}", there, durationText(static_cast<double>(promised) / info.exactSampleRate));
}

std::string typeByNameText(const FileFacts& facts)
{
    return facts.typeByName != 0 ? fourCCText(facts.typeByName) : "";
}

/// What is requested beside the description.
struct InfoOptions {
    bool isLong = false, isCheck = false, wantsMD5 = false, wantsSHA256 = false;
    unsigned threads = 0;
};

/// What is known about a file.
struct Description {
    AudioFileInfo info;
    FileFacts facts;
    std::string md5, sha256; // of the sound, in hexadecimal; empty if there is none
};

/// Adds digests. Compressed files have none except FLAC, which states its own.
void addDigests(Description& description, const std::string& path, const InfoOptions& wanted, bool quiet)
{
    using platform::Digest;
    const AudioFileInfo& info = description.info;
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    if (wanted.wantsMD5)
        description.md5 = hexText(StatedMD5(file));
    if (info.dataOffset <= 0 || info.dataSize <= 0)
        return;
    Digest md5(Digest::Kind::md5), sha256(Digest::Kind::sha256);
    std::vector<Digest*> digests;
    if (wanted.wantsMD5)
        digests.push_back(&md5);
    if (wanted.wantsSHA256)
        digests.push_back(&sha256);
    constexpr std::int64_t askedEvery = 1 << 20;
    Progress progress("reading", info.dataSize, quiet, path);
    requireOK(DigestAudio(file, info, digests, [&] {
        progress.advance(askedEvery);
        return true;
    }));
    if (wanted.wantsMD5)
        description.md5 = hexText(md5.finish());
    if (wanted.wantsSHA256)
        description.sha256 = hexText(sha256.finish());
}

constexpr const char* kColumns[] = {"path",
                                    "container",
                                    "containerName",
                                    "fileType",
                                    "formatCode",
                                    "coding",
                                    "sampleRate",
                                    "bitsPerSample",
                                    "sourceBits",
                                    "floatingPoint",
                                    "bitRate",
                                    "dsdRate",
                                    "channels",
                                    "channelLayout",
                                    "audioTracks",
                                    "frames",
                                    "durationSeconds",
                                    "isWhole",
                                    "missingBytes",
                                    "promisedFrames",
                                    "md5",
                                    "sha256",
                                    "dataOffset",
                                    "fileLength",
                                    "typeByName",
                                    "modified",
                                    "framesAreStated",
                                    "stereoPartner",
                                    "stereoPartnerExists",
                                    "error"};

Record recordOf(const std::string& path, const Description& description)
{
    const auto& [info, facts, md5, sha256] = description;
    Record record;
    record.member("path", path);
    record.member("container", fourCCText(info.containerId));
    record.member("containerName", containerWord(info));
    record.member("fileType", fourCCText(info.fileType));
    record.member("formatCode", fourCCText(info.formatCode));
    record.member("coding", codingWord(info));
    record.knownMember("sampleRate", positive(info.sampleRate));
    record.knownMember("bitsPerSample", positive(info.bitsPerSample));
    record.knownMember("sourceBits", positive(info.sourceBits));
    if (!info.compressed)
        record.member("floatingPoint", info.floatingPoint);
    record.knownMember("bitRate", positive(bitRateOf(info)));
    record.knownMember("dsdRate", positive(info.dsdRate));
    record.member("channels", info.channels);
    record.knownMember("channelLayout", layoutWord(info));
    if (info.audioTracks > 1)
        record.member("audioTracks", info.audioTracks);
    record.member("frames", info.frames);
    if (info.exactSampleRate > 0)
        record.member("durationSeconds", durationOf(info));
    record.member("isWhole", info.IsWhole());
    record.knownMember("missingBytes", positive(info.missingDataSize));
    record.knownMember("promisedFrames", positive(promisedFrames(info)));
    record.knownMember("md5", md5);
    record.knownMember("sha256", sha256);
    record.knownMember("dataOffset", positive(info.dataOffset));
    record.member("fileLength", info.fileLength);
    record.knownMember("typeByName", typeByNameText(facts));
    record.knownMember("modified", dateText(facts.modified));
    if (info.framesAreStated)
        record.member("framesAreStated", true); // no decoder could count them
    if (facts.stereo) {
        record.member("stereoPartner", shownName(facts.stereo->partner));
        record.member("stereoPartnerExists", facts.stereo->partnerExists);
    }
    return record;
}

std::vector<Table::Column> columns(const InfoOptions& wanted)
{
    std::vector<Table::Column> titles{
        {.title = "FILE", .isCuttable = true},        {.title = "TYPE", .dropRank = 5},
        {.title = "DURATION", .align = Align::right}, {.title = "RATE", .align = Align::right, .dropRank = 7},
        {.title = "FORMAT", .dropRank = 6},           {.title = "CHANNELS", .dropRank = wanted.isLong ? 4 : 8}};
    if (wanted.isLong) // what was requested is dropped last
        titles.insert(titles.end(), {{.title = "BY NAME", .dropRank = 3},
                                     {.title = "MODIFIED", .dropRank = 1},
                                     {.title = "STEREO PARTNER", .dropRank = 2, .isCuttable = true}});
    if (wanted.wantsMD5)
        titles.push_back({"MD5"});
    if (wanted.wantsSHA256)
        titles.push_back({"SHA-256"});
    return titles;
}

// Writes descriptions in one of the forms, each as soon as the form allows.
class InfoWriter {
public:
    InfoWriter(const OutputOptions& options, const InfoOptions& wanted)
        : form_(outputForm(options)),
          color_(usesColor(options.color)),
          wanted_(wanted),
          records_(options, kColumns)
    {
    }

    bool needsFacts() const { return isData() || wanted_.isLong; }

    void add(const std::string& path, const Description& description)
    {
        if (isData()) {
            records_.add(recordOf(path, description));
        } else if (form_ == Form::table) {
            addRow(path, description);
        } else if (form_ == Form::lines) {
            addLine(path, description);
        }
    }

    void addFailure(const std::string& path, const std::string& text) { records_.addFailure(path, text); }

    void finish()
    {
        records_.finish();
        table_.print(output_, color_);
    }

private:
    bool isData() const { return form_ == Form::json || form_ == Form::csv; }
    void addRow(const std::string& path, const Description& description)
    {
        const auto& [info, facts, md5, sha256] = description;
        std::vector<std::string> row{printable(path),   containerWord(info),
                                     lengthText(info),  rateText(info),
                                     formatWords(info), channelsText(info) + (wanted_.isLong ? tracksText(info) : "")};
        if (wanted_.isLong) {
            const auto& stereo = facts.stereo;
            row.push_back(typeByNameText(facts));
            row.push_back(localDateText(facts.modified));
            row.push_back(stereo ? printable(shownName(stereo->partner)) + (stereo->partnerExists ? "" : " (missing)")
                                 : "");
        }
        if (wanted_.wantsMD5)
            row.push_back(md5);
        if (wanted_.wantsSHA256)
            row.push_back(sha256);
        table_.add(std::move(row));
    }

    void addLine(const std::string& path, const Description& description)
    {
        const auto& [info, facts, md5, sha256] = description;
        output_.print("{}\t{}\t{:.6f}\t{}\t{}\t{}", printable(path), containerWord(info), durationOf(info),
                      info.sampleRate, formatWords(info), info.channels);
        if (wanted_.isLong)
            output_.print("\t{}\t{}\t{}\t{}", typeByNameText(facts), dateText(facts.modified),
                          facts.stereo ? printable(shownName(facts.stereo->partner)) : "",
                          !facts.stereo                 ? ""
                          : facts.stereo->partnerExists ? "there"
                                                        : "missing");
        if (wanted_.wantsMD5)
            output_.print("\t{}", md5);
        if (wanted_.wantsSHA256)
            output_.print("\t{}", sha256);
        output_.write("\n");
    }

    Form form_;
    bool color_;
    InfoOptions wanted_;
    Output& output_ = Output::standard();
    DataRecords records_;
    Table table_{columns(wanted_)};
};

bool runInfo(const FileArguments& files, const InfoOptions& wanted, const OutputOptions& options)
{
    if (wanted.isCheck)
        return checkFiles(files, wanted.threads, options);
    InfoWriter writer(options, wanted);
    const FileLoop loop{.threads = wanted.threads, .quiet = options.quiet};
    return writeFileByFile(writer, files, loop, [&](const FoundFile& file) {
        Description description{
            describeFile(file.path, options.quiet), writer.needsFacts() ? factsOf(file.path) : FileFacts(), {}, {}};
        if (wanted.wantsMD5 || wanted.wantsSHA256)
            addDigests(description, file.path, wanted, options.quiet);
        return description;
    });
}

void declareInfo(CommandLine& commandLine)
{
    static FileArguments files;
    static InfoOptions wanted;
    Verb& verb = commandLine.addVerb("info", "Say what audio files are: length, rate, format, channels",
                                     [&commandLine] { return runInfo(files, wanted, commandLine.output()); });
    CommandLine::addFilesOrInput(verb, files);
    commandLine.addCsv(verb);
    addThreads(verb, wanted.threads);
    const Argument isLong = verb.addFlag(
        "-l,--long", wanted.isLong,
        "Also the number of tracks, the type by the name, the date of modification and the stereo partner");
    const Argument md5 = verb.addFlag("--md5", wanted.wantsMD5, "Also the MD5 of the sound as it is stored");
    const Argument sha256 = verb.addFlag("--sha256", wanted.wantsSHA256, "Also the SHA-256 of the sound");
    verb.addFlag("--check", wanted.isCheck,
                 "Instead what is off, a line each: sizes, order, counts, digests, tracks; none: all is well")
        .excludes(isLong)
        .excludes(md5)
        .excludes(sha256);
}

const VerbRegistration infoRegistration{10, "info", declareInfo};

} // namespace
