// `ktfiles meta --jsonl` over 2,000 WAVE files as a process, compared with `exiftool -j` on the same files and with
// `ktfiles scan` on as many loops: processor time, in turns.
#include "LoopFiles.h"
#include "Timing.h"
#include "audiofile/metadata/AcidChunk.h"
#include "audiofile/metadata/AssociatedDataList.h"
#include "audiofile/metadata/BroadcastExtension.h"
#include "audiofile/metadata/CueList.h"
#include "audiofile/metadata/InfoList.h"
#include "audiofile/metadata/InstrumentChunk.h"
#include "audiofile/metadata/SamplerChunk.h"
#include "media/containers/ContainerHeaders.h"

#include <benchmark/benchmark.h>
#include <fmt/format.h>

#include <sys/resource.h>

#include <algorithm>
#include <cstdlib>

namespace {

constexpr int kFiles = 2000;
constexpr std::size_t kSampleBytes = 60'000;

void putChunk(ByteWriter& out, FourCC id, BytesView body)
{
    out.writeFourCC(id);
    out.write(static_cast<std::uint32_t>(body.size()));
    out.write(body);
    out.writeZeros(body.size() & 1);
}

// The chunks of recorders, editors and loop makers, at typical sizes.

void putBroadcast(ByteWriter& out, int number)
{
    BroadcastExtension bext;
    bext.description.set(fmt::format("Scene 12 take {} #speed=24", number));
    bext.originator.set("Recorder 788");
    bext.originatorReference.set(fmt::format("USREC78800{:06}", number));
    bext.originationDate.set("2026-11-22");
    bext.originationTime.set("10:44:00");
    bext.setTimeReference(48000U * 3600U + static_cast<unsigned>(number));
    bext.version = 2;
    for (std::size_t i = 0; i < 32; ++i)
        bext.umid[i] = static_cast<std::byte>(i + 1);
    bext.loudnessValue = -2300;
    bext.loudnessRange = 500;
    bext.maxTruePeakLevel = -100;
    bext.maxMomentaryLoudness = -1800;
    bext.maxShortTermLoudness = -2048;
    const BytesView history = bytesOf("A=PCM,F=48000,W=24,M=stereo,T=rec\r\nA=PCM,F=48000,W=16,M=stereo,T=edit\r\n");
    bext.codingHistory = {history.begin(), history.end()};
    putChunk(out, fourCC("bext"), bext.write());
}

void putXML(ByteWriter& out, int number)
{
    std::string tracks;
    for (int i = 1; i <= 4; ++i)
        tracks += fmt::format("<TRACK><CHANNEL_INDEX>{0}</CHANNEL_INDEX><INTERLEAVE_INDEX>{0}</INTERLEAVE_INDEX>"
                              "<NAME>Boom {0}</NAME><FUNCTION>M</FUNCTION></TRACK>\n",
                              i);
    putChunk(out, fourCC("iXML"),
             bytesOf(fmt::format(
                 R"(<?xml version="1.0" encoding="UTF-8"?>
<BWFXML><IXML_VERSION>1.61</IXML_VERSION><PROJECT>The film</PROJECT><SCENE>12</SCENE><TAKE>{0}</TAKE>
<TAPE>221126</TAPE><CIRCLED>FALSE</CIRCLED><FILE_UID>USREC{0:012}</FILE_UID><UBITS>00000000</UBITS>
<NOTE>good one</NOTE><SPEED><NOTE/><MASTER_SPEED>24/1</MASTER_SPEED><CURRENT_SPEED>24/1</CURRENT_SPEED>
<TIMECODE_RATE>24/1</TIMECODE_RATE><TIMECODE_FLAG>NDF</TIMECODE_FLAG><FILE_SAMPLE_RATE>48000</FILE_SAMPLE_RATE>
<AUDIO_BIT_DEPTH>24</AUDIO_BIT_DEPTH><DIGITIZER_SAMPLE_RATE>48000</DIGITIZER_SAMPLE_RATE>
<TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_HI>0</TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_HI>
<TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_LO>{0}</TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_LO>
<TIMESTAMP_SAMPLE_RATE>48000</TIMESTAMP_SAMPLE_RATE></SPEED><TRACK_LIST><TRACK_COUNT>4</TRACK_COUNT>
{1}</TRACK_LIST><BEXT><BWF_DESCRIPTION>Scene 12</BWF_DESCRIPTION><BWF_ORIGINATOR>Recorder</BWF_ORIGINATOR>
</BEXT></BWFXML>)",
                 number, tracks)));
}

void putInfo(ByteWriter& out, int number)
{
    InfoList info;
    info.set(fourCC("INAM"), fmt::format("Loop {}", number));
    info.set(fourCC("IART"), "Somebody");
    info.set(fourCC("ICRD"), "2026");
    info.set(fourCC("ISFT"), "An editor 1.2");
    info.set(fourCC("IGNR"), "Techno");
    putChunk(out, fourCC("LIST"), info.write());
}

void putCues(ByteWriter& out)
{
    CueList cues;
    AssociatedDataList texts;
    for (std::uint32_t id = 1; id <= 4; ++id) {
        CuePoint& point = cues.points.emplace_back();
        point.id = id;
        point.position = point.sampleOffset = 1000 * id;
        texts.addLabel(id, fmt::format("Marker {}", id));
    }
    putChunk(out, fourCC("cue "), cues.write());
    putChunk(out, fourCC("LIST"), texts.write());
}

void putLoop(ByteWriter& out)
{
    SamplerChunk sampler;
    sampler.samplePeriod = 20833;
    sampler.midiUnityNote = 60;
    sampler.loops.emplace_back().end = 9999;
    putChunk(out, fourCC("smpl"), sampler.write());
    putChunk(out, fourCC("inst"), InstrumentChunk().write());
    AcidChunk acid;
    acid.beats = 8;
    acid.tempo = 97.5F;
    putChunk(out, fourCC("acid"), acid.write());
}

/// Recordings with all chunks before the samples or after them; loops of samplers; edited sounds with markers.
Bytes waveFile(int number)
{
    ByteWriter out(std::endian::little);
    out.writeFourCC(kWAVE);
    const int kind = number % 5;
    if (kind < 2 || kind == 4)
        putBroadcast(out, number);
    if (kind == 0)
        putXML(out, number);
    ByteWriter format(std::endian::little);
    for (const int field : {1, 2, 48000, 0, 192000 & 0xFFFF, 192000 >> 16, 4, 16})
        format.write(static_cast<std::uint16_t>(field));
    putChunk(out, fourCC("fmt "), format.take());
    putChunk(out, fourCC("data"), Bytes(kSampleBytes));
    if (kind >= 3)
        putCues(out);
    if (kind == 2 || kind == 4)
        putLoop(out);
    if (kind >= 1 && kind <= 3)
        putInfo(out, number);
    if (kind == 4)
        putXML(out, number);
    ByteWriter file(std::endian::little);
    file.writeFourCC(kRIFF);
    file.write(static_cast<std::uint32_t>(out.size()));
    file.write(out.take());
    return file.take();
}

/// Processor time of a command on a folder.
double secondsOf(benchmark::State& state, const char* command, const std::filesystem::path& folder)
{
    const double before = processorSecondsOfChildren();
    if (std::system(fmt::format("{} '{}' > /dev/null", command, folder.string()).c_str()) != 0)
        state.SkipWithError(command);
    return processorSecondsOfChildren() - before;
}

void MetaCommand(benchmark::State& state)
{
    const BenchFolder waves, loops;
    const Bytes loop = aiffLoop();
    for (int i = 0; i < kFiles; ++i) {
        waves.write(fmt::format("{:04}.wav", i), waveFile(i));
        loops.write(fmt::format("{:04}.aif", i), loop);
    }
    std::vector<double> meta, only, scan;
    for (auto _ : state) {
        meta.push_back(secondsOf(state, "'" KTFILES_COMMAND "' meta -j 1 --jsonl", waves.path()));
        only.push_back(secondsOf(state, "'" KTFILES_COMMAND "' meta -j 1 --jsonl --only bext", waves.path()));
        scan.push_back(secondsOf(state, "'" KTFILES_COMMAND "' scan -j 1", loops.path()));
        state.SetIterationTime(meta.back());
    }
    const double exiftool = secondsOf(state, "exiftool -q -q -j -r", waves.path());
    state.counters["us_per_file"] = median(meta) * 1e6 / kFiles;
    state.counters["only_bext_us_per_file"] = median(only) * 1e6 / kFiles;
    state.counters["scan_us_per_file"] = median(scan) * 1e6 / kFiles;
    state.counters["times_scan"] = median(meta) / median(scan); // at most 2
    state.counters["exiftool_times"] = exiftool / median(meta); // at least 20
}
BENCHMARK(MetaCommand)->UseManualTime()->Iterations(9)->Unit(benchmark::kMillisecond);

} // namespace
