// ktfiles info: what audio files are.
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileFacts.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <cmath>

namespace {

/// Of a file that is known, but not decoded here.
void failAsDecoderDoes(const std::string& path, const std::string& kind)
{
    CAudioFileIO audio;
    openAudio(audio, path);
    try {
        requireDecoder(audio);
    } catch (const Failure& failure) {
        throw Failure(kind + ": " + failure.what());
    }
}

AudioFileInfo describe(const std::string& path, bool quiet)
{
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    AudioFileInfo info;
    const std::int32_t status = GetAudioFileInfo(file, 0, info);
    if (file.GetEOF() == 0)
        throw OtherKind("is empty", OtherKind::Kind::unknown);
    if (status == platform::AudioHandle::kFormatNotSupported)
        failAsDecoderDoes(path, containerWord(info));
    if (status == kStatusEndOfFile)
        throw Failure("ends within its header");
    if (status == kStatusParameterError || (status == kStatusOK && info.containerId == 0))
        throw OtherKind("no audio file known here", OtherKind::Kind::unknown);
    requireOK(status);
    if (info.framesAreStated) { // by a header: the decoder, where there is one, counts
        CAudioFileIO audio;
        openAudio(audio, path);
        audio.OpenDecoder();
        return audio.Info();
    }
    return info;
}

double durationOf(const AudioFileInfo& info)
{
    return info.exactSampleRate > 0 ? static_cast<double>(info.frames) / info.exactSampleRate : 0;
}

std::string rateText(const AudioFileInfo& info)
{
    return fmt::format("{:.10g} kHz", info.exactSampleRate / 1000);
}

std::string channelsText(const AudioFileInfo& info)
{
    const std::string layout = layoutWord(info);
    return !layout.empty()      ? layout
           : info.channels == 1 ? "mono"
           : info.channels == 2 ? "stereo"
                                : fmt::format("{} channels", info.channels);
}

std::string tracksText(const AudioFileInfo& info)
{
    return info.audioTracks > 1 ? fmt::format(", first of {} tracks", info.audioTracks) : "";
}

/// What the headers promise, where that is more than there is; 0 where it cannot be told.
std::int64_t promisedFrames(const AudioFileInfo& info)
{
    if (info.promisedFrames > info.frames)
        return info.promisedFrames;
    return info.missingDataSize > 0 && info.bytesPerFrame > 0 ? info.frames + info.missingDataSize / info.bytesPerFrame
                                                              : 0;
}

std::string lengthText(const AudioFileInfo& info)
{
    const std::string there = durationText(durationOf(info));
    const std::int64_t promised = promisedFrames(info);
    if (promised == 0 || info.exactSampleRate <= 0)
        return info.missingDataSize > 0 ? there + ", cut" : there;
    return fmt::format("{} of {}", there, durationText(static_cast<double>(promised) / info.exactSampleRate));
}

/// Of compressed sound, bits per second; 0 where it cannot be told, as of one track of several.
std::int64_t bitRateOf(const AudioFileInfo& info)
{
    if (info.audioTracks > 1)
        return 0;
    const double duration = durationOf(info);
    const std::int64_t bytes = info.dataSize > 0 ? info.dataSize : info.fileLength;
    return info.compressed && duration > 0 ? std::llround(static_cast<double>(bytes) * 8 / duration) : 0;
}

std::string typeByNameText(const FileFacts& facts)
{
    return facts.typeByName != 0 ? fourCCText(facts.typeByName) : "";
}

template <class Number>
std::optional<Number> positive(Number number)
{
    return number > 0 ? std::optional(number) : std::nullopt;
}

/// What is known of a file.
struct Description {
    AudioFileInfo info;
    FileFacts facts;
};

void writeJson(JsonWriter& json, const std::string& path, const Description& description)
{
    const auto& [info, facts] = description;
    json.beginObject();
    json.member("path", path);
    json.member("container", fourCCText(info.containerId));
    json.member("containerName", containerWord(info));
    json.member("fileType", fourCCText(info.fileType));
    json.member("formatCode", fourCCText(info.formatCode));
    json.member("coding", codingWord(info));
    json.knownMember("sampleRate", positive(info.sampleRate));
    json.knownMember("bitsPerSample", positive(info.bitsPerSample));
    json.knownMember("sourceBits", positive(info.sourceBits));
    if (!info.compressed)
        json.member("floatingPoint", info.floatingPoint);
    json.knownMember("bitRate", positive(bitRateOf(info)));
    json.knownMember("dsdRate", positive(info.dsdRate));
    json.member("channels", info.channels);
    json.knownMember("channelLayout", layoutWord(info));
    if (info.audioTracks > 1)
        json.member("audioTracks", info.audioTracks);
    json.member("frames", info.frames);
    if (info.exactSampleRate > 0)
        json.member("durationSeconds", durationOf(info));
    json.member("isWhole", info.IsWhole());
    json.knownMember("missingBytes", positive(info.missingDataSize));
    json.knownMember("promisedFrames", positive(promisedFrames(info)));
    json.knownMember("dataOffset", positive(info.dataOffset));
    json.member("fileLength", info.fileLength);
    json.knownMember("typeByName", typeByNameText(facts));
    json.knownMember("modified", dateText(facts.modified));
    if (info.framesAreStated)
        json.member("framesAreStated", true); // no decoder could count them
    if (facts.stereo) {
        json.member("stereoPartner", facts.stereo->partner);
        json.member("stereoPartnerExists", facts.stereo->partnerExists);
    }
    json.endObject();
}

std::vector<Table::Column> columns(bool isLong)
{
    std::vector<Table::Column> titles{{"FILE"},   {"TYPE"},    {"DURATION", Align::right}, {"RATE", Align::right},
                                      {"FORMAT"}, {"CHANNELS"}};
    if (isLong)
        titles.insert(titles.end(), {{"BY NAME"}, {"MODIFIED"}, {"STEREO PARTNER"}});
    return titles;
}

// Writes the descriptions in one of the forms, each as soon as it is known where the form allows that.
class InfoWriter {
public:
    InfoWriter(const OutputOptions& options, bool isLong)
        : form_(outputForm(options)),
          color_(usesColor(options.color)),
          isLong_(isLong),
          json_(options)
    {
    }

    bool needsFacts() const { return form_ == Form::json || isLong_; }

    void add(const std::string& path, const Description& description)
    {
        if (form_ == Form::json) {
            writeJson(json_.begin(), path, description);
            json_.end();
        } else if (form_ == Form::table) {
            addRow(path, description);
        } else if (form_ == Form::lines) {
            addLine(path, description);
        }
    }

    void addFailure(const std::string& path, const std::string& text)
    {
        if (form_ == Form::json)
            json_.addFailure(path, text);
    }

    void finish()
    {
        if (form_ == Form::json)
            json_.finish();
        table_.print(output_, color_);
    }

private:
    void addRow(const std::string& path, const Description& description)
    {
        const auto& [info, facts] = description;
        std::vector<std::string> row{printable(path),   containerWord(info),
                                     lengthText(info),  rateText(info),
                                     formatWords(info), channelsText(info) + (isLong_ ? tracksText(info) : "")};
        if (isLong_) {
            const auto& stereo = facts.stereo;
            row.push_back(typeByNameText(facts));
            row.push_back(localDateText(facts.modified));
            row.push_back(stereo ? printable(stereo->partner) + (stereo->partnerExists ? "" : " (missing)") : "");
        }
        table_.add(std::move(row));
    }

    void addLine(const std::string& path, const Description& description)
    {
        const auto& [info, facts] = description;
        output_.print("{}\t{}\t{:.6f}\t{}\t{}\t{}", printable(path), containerWord(info), durationOf(info),
                      info.sampleRate, formatWords(info), info.channels);
        if (isLong_)
            output_.print("\t{}\t{}\t{}\t{}", typeByNameText(facts), dateText(facts.modified),
                          facts.stereo ? printable(facts.stereo->partner) : "",
                          !facts.stereo                 ? ""
                          : facts.stereo->partnerExists ? "there"
                                                        : "missing");
        output_.write("\n");
    }

    Form form_;
    bool color_;
    bool isLong_;
    Output& output_ = Output::standard();
    JsonRecords json_;
    Table table_{columns(isLong_)};
};

bool runInfo(const FileArguments& files, bool isLong, const OutputOptions& options)
{
    InfoWriter writer(options, isLong);
    return writeFileByFile(writer, files, options, [&](const FoundFile& file) {
        return Description{describe(file.path, options.quiet), writer.needsFacts() ? factsOf(file.path) : FileFacts()};
    });
}

void declareInfo(CommandLine& commandLine)
{
    static FileArguments files;
    static bool isLong = false;
    Verb& verb = commandLine.addVerb("info", "Say what audio files are: length, rate, format, channels",
                                     [&commandLine] { return runInfo(files, isLong, commandLine.output()); });
    CommandLine::addFiles(verb, files);
    verb.addFlag("-l,--long", isLong,
                 "Also the number of tracks, the type by the name, the date of modification and the stereo partner");
}

const VerbRegistration registration{10, declareInfo};

} // namespace
