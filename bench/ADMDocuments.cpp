#include "ADMDocuments.h"

#include <algorithm>
#include <cstdio>

namespace {

// Channel formats and objects are numbered from here; lower numbers are for common definitions.
constexpr int kFirstNumber = 0x1001;
// Blocks per second, and the length of one.
constexpr int kBlocksPerSecond = 50;
constexpr int kBlockLength = 100000 / kBlocksPerSecond; // 1/100000 s

template <class... Values>
void write(std::string& text, const char* format, Values... values)
{
    char line[1024];
    text.append(line, static_cast<std::size_t>(std::snprintf(line, sizeof line, format, values...)));
}

} // namespace

ADMDocumentStream::ADMDocumentStream(ADMDocumentShape shape) : shape_(shape)
{
}

std::ptrdiff_t ADMDocumentStream::read(std::span<std::byte> buffer)
{
    if (at_ > 0) {
        text_.erase(0, at_);
        at_ = 0;
    }
    while (text_.size() < buffer.size() && !isComplete_)
        writeMore();
    at_ = std::min(buffer.size(), text_.size());
    std::copy_n(std::as_bytes(std::span(text_)).begin(), at_, buffer.begin());
    return static_cast<std::ptrdiff_t>(at_);
}

void ADMDocumentStream::writeMore()
{
    if (object_ < 0) {
        writeHead();
        object_ = 0;
    } else if (object_ == shape_.objects) {
        writeTail();
        isComplete_ = true;
    } else {
        if (block_ == 0)
            writeObject(object_);
        writeBlock(object_, block_);
        if (++block_ == shape_.blocksPerObject) {
            text_ += "      </audioChannelFormat>\n";
            block_ = 0;
            ++object_;
        }
    }
}

void ADMDocumentStream::writeHead()
{
    text_ += "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
             "<ebuCoreMain xmlns=\"urn:ebu:metadata-schema:ebuCore_2016\" xml:lang=\"en\">\n"
             "  <coreMetadata>\n    <format>\n     <audioFormatExtended version=\"ITU-R_BS.2076-2\">\n"
             "      <audioProgramme audioProgrammeID=\"APR_1001\" audioProgrammeName=\"Benchmark\">\n"
             "        <audioContentIDRef>ACO_1001</audioContentIDRef>\n"
             "      </audioProgramme>\n"
             "      <audioContent audioContentID=\"ACO_1001\" audioContentName=\"Everything\">\n";
    for (int object = 0; object < shape_.objects; ++object)
        write(text_, "        <audioObjectIDRef>AO_%04X</audioObjectIDRef>\n", kFirstNumber + object);
    text_ += "        <dialogue mixedContentKind=\"1\">2</dialogue>\n      </audioContent>\n";
}

void ADMDocumentStream::writeObject(int object)
{
    const int n = kFirstNumber + object;
    write(text_,
          "      <audioObject audioObjectID=\"AO_%04X\" audioObjectName=\"Object %d\" start=\"00:00:00.00000\">\n"
          "        <audioPackFormatIDRef>AP_0003%04X</audioPackFormatIDRef>\n"
          "        <audioTrackUIDRef>ATU_%08X</audioTrackUIDRef>\n"
          "      </audioObject>\n",
          n, object, n, n);
    write(text_,
          "      <audioTrackUID UID=\"ATU_%08X\" sampleRate=\"48000\" bitDepth=\"24\">\n"
          "        <audioTrackFormatIDRef>AT_0003%04X_01</audioTrackFormatIDRef>\n"
          "        <audioPackFormatIDRef>AP_0003%04X</audioPackFormatIDRef>\n"
          "      </audioTrackUID>\n",
          n, n, n);
    write(text_,
          "      <audioPackFormat audioPackFormatID=\"AP_0003%04X\" audioPackFormatName=\"Pack\" typeLabel=\"0003\">\n"
          "        <audioChannelFormatIDRef>AC_0003%04X</audioChannelFormatIDRef>\n"
          "      </audioPackFormat>\n",
          n, n);
    write(text_,
          "      <audioStreamFormat audioStreamFormatID=\"AS_0003%04X\" audioStreamFormatName=\"PCM\" "
          "formatLabel=\"0001\">\n"
          "        <audioChannelFormatIDRef>AC_0003%04X</audioChannelFormatIDRef>\n"
          "        <audioTrackFormatIDRef>AT_0003%04X_01</audioTrackFormatIDRef>\n"
          "      </audioStreamFormat>\n",
          n, n, n);
    write(text_,
          "      <audioTrackFormat audioTrackFormatID=\"AT_0003%04X_01\" audioTrackFormatName=\"PCM\">\n"
          "        <audioStreamFormatIDRef>AS_0003%04X</audioStreamFormatIDRef>\n"
          "      </audioTrackFormat>\n",
          n, n);
    write(text_,
          "      <audioChannelFormat audioChannelFormatID=\"AC_0003%04X\" audioChannelFormatName=\"Channel\" "
          "typeLabel=\"0003\" typeDefinition=\"Objects\">\n",
          n);
}

void ADMDocumentStream::writeBlock(int object, int block)
{
    const int seconds = block / kBlocksPerSecond;
    write(text_,
          "        <audioBlockFormat audioBlockFormatID=\"AB_0003%04X_%08X\" rtime=\"%02d:%02d:%02d.%05d\" "
          "duration=\"00:00:00.%05d\">\n"
          "          <position coordinate=\"azimuth\">%.6f</position>\n"
          "          <position coordinate=\"elevation\">%.6f</position>\n"
          "          <position coordinate=\"distance\">%.6f</position>\n"
          "          <gain>0.707107</gain>\n"
          "          <jumpPosition interpolationLength=\"0.005\">1</jumpPosition>\n"
          "        </audioBlockFormat>\n",
          kFirstNumber + object, block + 1, seconds / 3600, seconds / 60 % 60, seconds % 60,
          block % kBlocksPerSecond * kBlockLength, kBlockLength, (block * 7 + object * 13) % 3600 / 10.0 - 180,
          (block * 3 + object) % 1800 / 10.0 - 90, 0.5 + block % 50 * 0.01);
}

void ADMDocumentStream::writeTail()
{
    text_ += "     </audioFormatExtended>\n    </format>\n  </coreMetadata>\n</ebuCoreMain>\n";
}
