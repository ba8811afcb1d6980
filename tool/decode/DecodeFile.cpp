#include "tool/decode/DecodeFile.h"

#include "tool/decode/DecodeMetadata.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Output.h"
#include "tool/shared/output/Progress.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <cstdio>
#include <memory>

namespace {

/// A file or standard output. Standard output receives nothing more once it failed.
class Target {
public:
    Target(const DecodeJob& job, bool force) : out_(job.output)
    {
        if (job.output != "-")
            file_ = std::make_unique<OutputFile>(job.output, job.file,
                                                 force ? OutputFile::Existing::replace : OutputFile::Existing::refuse);
    }

    bool failed() const { return !file_ && Output::standard().failed(); }
    void write(std::string_view bytes)
    {
        if (file_) {
            file_->write(bytes);
        } else {
            Output::standard().write(bytes);
            Output::standard().flush();
        }
    }
    /// Null for an output that cannot be rewound.
    OutputFile* regular() const { return file_ && file_->isRegular() ? file_.get() : nullptr; }
    void finish(bool quiet)
    {
        if (!file_)
            return;
        const FileAccess access = accessToReplaced(quiet);
        file_->finish();
    }

private:
    FileAccess accessToReplaced(bool quiet) const
    {
        const std::string& path = file_->replaced();
        try {
            return path.empty() ? nullptr
                                : accessForWriting(path, platform::FileCoordinator::WritingOptions::forReplacing,
                                                   {.quiet = quiet});
        } catch (const Failure& failure) {
            throw Failure(asGiven(path, out_) + " " + failure.what());
        }
    }

    std::string out_;
    std::unique_ptr<OutputFile> file_;
};

/// Writes the header, then the samples; returns the number of frames. The first samples are written with the header,
/// because some readers of a pipe examine only what the first read returns.
std::int64_t copySound(std::string header, DecodeSource& source, Target& target, bool showsProgress)
{
    Progress progress("decoding", source.sound().frames, !showsProgress);
    const std::int64_t bytesPerFrame = source.sound().bytesPerFrame();
    std::int64_t done = 0;
    for (std::string_view samples = source.read(); !samples.empty() && !target.failed(); samples = source.read()) {
        target.write(header.empty() ? samples : std::string_view(header.append(samples)));
        header.clear();
        const std::int64_t frames = std::ssize(samples) / bytesPerFrame;
        done += frames;
        progress.advance(frames);
    }
    target.write(header); // there were no samples
    return done;
}

// A damaged file may end before the length that it promises.
void setFrames(const DecodeFrame& frame, std::int64_t frames, const DecodeResult& result, Target& target)
{
    const std::string header = frame.header(frames);
    if (header.empty())
        return;
    if (target.regular() == nullptr)
        throw Failure(fmt::format("ends after {} of {} frames, and the header says more", frames, result.sound.frames));
    target.regular()->rewrite(0, header);
}

void writeSound(DecodeSource& source, const DecodeFrame& frame, Target& target, bool showsProgress,
                DecodeResult& result)
{
    const std::int64_t frames = copySound(frame.header(source.sound().frames), source, target, showsProgress);
    if (frames != result.sound.frames && !target.failed())
        setFrames(frame, frames, result, target);
    target.write(frame.trailer(frames));
    result.sound.frames = frames;
    result.clippedSamples = source.clippedSamples();
}

/// What is damaged in the sound; empty if nothing is known to be.
std::string damageTo(const DecodeSource& source)
{
    if (const std::uint64_t missing = source.missingFrames(); missing > 0)
        return fmt::format("{} cannot be decoded", missing == 1 ? "1 frame" : fmt::format("{} frames", missing));
    return source.isOtherThanItsChecksum() ? "the sound is not what its checksum says" : "";
}

std::vector<std::string> notesOn(const DecodeSource& source, const DecodeResult& result)
{
    std::vector<std::string> notes = source.notes();
    if (result.sound.frames < source.sound().frames)
        notes.push_back(fmt::format("ends after {} of {} frames", result.sound.frames, source.sound().frames));
    if (const std::string damage = damageTo(source); !damage.empty())
        notes.push_back(damage + (result.missingFrames > 0 ? "; they are silent" : ""));
    if (result.clippedSamples > 0)
        notes.push_back(fmt::format("{} clipped; --bits f32 keeps what is beyond full scale",
                                    result.clippedSamples == 1 ? "1 sample is"
                                                               : fmt::format("{} samples are", result.clippedSamples)));
    notes.insert(notes.end(), result.tags.notKept.begin(), result.tags.notKept.end());
    return notes;
}

} // namespace

DecodeResult decodeFile(const DecodeJob& job, const DecodeOptions& options)
{
    FileAccess access = accessForReading(job.file, {.quiet = options.quiet});
    DecodeSource source(job.file, options.wishes);
    DecodeTags tags(job.file);
    Target target(job, options.force);
    const DecodedSound& sound = source.sound();
    const DecodeFormat& format = *options.wishes.format;
    const std::string container = DecodeFrame(sound, format).container();
    const bool isFile = target.regular() != nullptr;
    const FollowingTags following{isFile && tags.carriesTexts(container, source.isWhole()),
                                  isFile && tags.carriesGenre(container, source.isWhole())};
    KeptMetadata kept = DecodeMetadata(job.file).keptIn(format.fileType,
                                                        {source.sourceRate(), sound.sampleRate, source.start(),
                                                         static_cast<std::uint64_t>(sound.frames), source.isWhole()},
                                                        sound, following);
    tags.forget(kept.sourceIds);
    if (kept.hasTexts && !following.texts)
        tags.forgetTexts();
    const DecodeFrame frame(sound, format, std::move(kept.chunks));
    DecodeResult result{.output = shownName(job.output),
                        .container = frame.container(),
                        .sound = sound,
                        .clippedSamples = 0,
                        .missingFrames = 0,
                        .tags = {},
                        .kept = std::move(kept.names)};
    writeSound(source, frame, target, options.showsProgress, result);
    access.reset(); // before waiting for others who hold the output
    if (target.failed())
        return result;
    result.missingFrames = source.missingFrames();
    if (const std::string damage = damageTo(source); !damage.empty() && !options.conceal)
        throw Failure(damage + "; --conceal takes it as it is");
    result.tags =
        tags.carryTo(target.regular() != nullptr ? target.regular()->path() : "", result.container, result.sound,
                     source.sourceRate(), source.isWhole() && result.sound.frames == source.sound().frames);
    result.tags.notKept.insert(result.tags.notKept.end(), kept.notKept.begin(), kept.notKept.end());
    target.finish(options.quiet);
    result.notes = notesOn(source, result);
    return result;
}
