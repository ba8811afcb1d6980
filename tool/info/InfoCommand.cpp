// ktfiles info: what audio files are.
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/FileFacts.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <algorithm>

namespace {

AudioFileInfo describe(const std::string& path, bool quiet)
{
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    AudioFileInfo info;
    const std::int32_t status = GetAudioFileInfo(file, 0, info);
    if (file.GetEOF() == 0)
        throw Failure("is empty");
    if (status == platform::AudioHandle::kFormatNotSupported) {
        CAudioFileIO audio;
        openAudio(audio, path);
        requireDecoder(audio); // knows why
    }
    if (status == kStatusEndOfFile)
        throw Failure("ends within its header");
    if (status == kStatusParameterError || (status == kStatusOK && info.containerId == 0))
        throw Failure("no audio file known here");
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

std::string channelsText(int channels)
{
    return channels == 1 ? "mono" : channels == 2 ? "stereo" : fmt::format("{} channels", channels);
}

std::string containerText(const AudioFileInfo& info)
{
    static constexpr std::pair<FourCC, const char*> names[] = {
        {kRIFF, "WAVE"},
        {kCaff, "CAF"},
        {kCAT, "REX2"},
        {fourCC("MPG3"), "MP3"},
        {fourCC("adts"), "AAC"},
        {fourCC("M4A "), "M4A"},
        {fourCC("mpg4"), "MP4"},
        {fourCC("flac"), "FLAC"},
        {fourCC("ogg "), "Ogg"},
        {fourCC("asf "), "WMA"},
        {fourCC("NeXT"), "AU"},
        {fourCC("wvpk"), "WavPack"},
        {fourCC("ape "), "APE"},
        {fourCC("ac-3"), "AC-3"},
        {fourCC("MPG2"), "MP2"},
        {fourCC("tta "), "TTA"},
        {fourCC("tak "), "TAK"},
        {fourCC("W64f"), "Wave64"},
        {fourCC("mkv "), "Matroska"},
    };
    if (info.containerId == kFORM)
        return fourCCText(info.formType);
    const auto* const known = std::find_if(std::begin(names), std::end(names),
                                           [&](const auto& name) { return name.first == info.containerId; });
    return known != std::end(names) ? known->second : fourCCText(info.containerId);
}

// ".mp3" and "aac " as people know them.
std::string codingText(FourCC coding)
{
    std::string text = fourCCText(coding);
    text.erase(text.find_last_not_of(' ') + 1);
    return text.starts_with('.') ? text.substr(1) : text;
}

std::string formatText(const AudioFileInfo& info)
{
    constexpr FourCC kWaveTag = 0x6D730000; // "ms" and the number of the format in a WAVE file
    if (info.compressed && (info.formatCode & 0xFFFF0000) == kWaveTag)
        return fmt::format("format 0x{:04X}", info.formatCode & 0xFFFF);
    if (info.compressed)
        return codingText(info.formatCode);
    return fmt::format("{}-bit{}", info.bitsPerSample, info.floatingPoint ? " float" : "");
}

std::string typeByNameText(const FileFacts& facts)
{
    return facts.typeByName != 0 ? fourCCText(facts.typeByName) : "";
}

void writeJson(JsonWriter& json, const std::string& path, const AudioFileInfo& info, const FileFacts& facts)
{
    json.beginObject();
    json.member("path", path);
    json.member("container", fourCCText(info.containerId));
    json.member("fileType", fourCCText(info.fileType));
    json.member("formatCode", fourCCText(info.formatCode));
    json.member("sampleRate", info.sampleRate);
    json.member("bitsPerSample", info.bitsPerSample);
    json.member("channels", info.channels);
    json.member("floatingPoint", info.floatingPoint);
    json.member("frames", info.frames);
    json.member("durationSeconds", durationOf(info));
    json.member("dataOffset", info.dataOffset);
    json.member("fileLength", info.fileLength);
    json.member("typeByName", typeByNameText(facts));
    json.member("modified", dateText(facts.modified));
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
          isLong_(isLong)
    {
    }

    void add(const std::string& path, const AudioFileInfo& info)
    {
        const FileFacts facts = form_ == Form::json || isLong_ ? factsOf(path) : FileFacts();
        if (form_ == Form::json)
            writeJson(json_.next(), path, info, facts);
        else if (form_ == Form::table)
            addRow(path, info, facts);
        else if (form_ == Form::lines)
            addLine(path, info, facts);
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
    void addRow(const std::string& path, const AudioFileInfo& info, const FileFacts& facts)
    {
        std::vector<std::string> row{printable(path), containerText(info), durationText(durationOf(info)),
                                     rateText(info),  formatText(info),    channelsText(info.channels)};
        if (isLong_) {
            const auto& stereo = facts.stereo;
            row.push_back(typeByNameText(facts));
            row.push_back(localDateText(facts.modified));
            row.push_back(stereo ? printable(stereo->partner) + (stereo->partnerExists ? "" : " (missing)") : "");
        }
        table_.add(std::move(row));
    }

    void addLine(const std::string& path, const AudioFileInfo& info, const FileFacts& facts)
    {
        output_.print("{}\t{}\t{:.6f}\t{}\t{}\t{}", printable(path), containerText(info), durationOf(info),
                      info.sampleRate, formatText(info), info.channels);
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

bool runInfo(const std::vector<std::string>& files, bool isLong, const OutputOptions& options)
{
    InfoWriter writer(options, isLong);
    return writeFileByFile(writer, files, [&](const std::string& path) { return describe(path, options.quiet); });
}

void declareInfo(CommandLine& commandLine)
{
    static std::vector<std::string> files;
    static bool isLong = false;
    Verb& verb = commandLine.addVerb("info", "Say what audio files are: length, rate, format, channels",
                                     [&commandLine] { return runInfo(files, isLong, commandLine.output()); });
    CommandLine::addFiles(verb, files).required();
    verb.addFlag("-l,--long", isLong, "Also the type by the name, the date of modification and the stereo partner");
}

const VerbRegistration registration{10, declareInfo};

} // namespace
