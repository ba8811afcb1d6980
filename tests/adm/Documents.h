// Small documents for the tests.
#pragma once

#include "adm/ADMDocument.h"

#include <memory>
#include <string>
#include <string_view>

/// The elements within the envelopes that documents have.
inline std::string enveloped(std::string_view elements)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<ebuCoreMain><coreMetadata><format><audioFormatExtended>" +
           std::string(elements) + "</audioFormatExtended></format></coreMetadata></ebuCoreMain>";
}

inline std::unique_ptr<ADMDocument> documentOf(std::string_view text)
{
    const BytesView bytes = bytesOf(text);
    return ADMDocument::initWithADMData(Bytes(bytes.begin(), bytes.end()));
}

/// "Name: reason" of what `work` raises; empty when it raises nothing.
template <class Work>
std::string raised(Work work)
{
    try {
        work();
    } catch (const ADMException& problem) {
        return problem.name() + ": " + problem.reason();
    }
    return {};
}

/// A whole small document: every element, every reference.
inline constexpr std::string_view kWholeDocument =
    R"(<?xml version="1.0" encoding="UTF-8"?>
<ebuCoreMain xmlns="urn:ebu:metadata-schema:ebuCore_2016" xmlns:x="urn:x" xml:lang="en">
 <coreMetadata><format><audioFormatExtended>
  <audioProgramme audioProgrammeID="APR_1001" audioProgrammeName="P" audioProgrammeLanguage="de" start="00:00:01.00000"
      end="00:01:00.00000" maxDuckingDepth="-12">
   <audioContentIDRef>ACO_1001</audioContentIDRef>
   <audioProgrammeLabel language="de">Nachrichten</audioProgrammeLabel>
   <audioProgrammeLabel>nameless</audioProgrammeLabel>
   <loudnessMetadata><integratedLoudness>-23</integratedLoudness></loudnessMetadata>
  </audioProgramme>
  <audioContent audioContentID="ACO_1001" audioContentName="C &amp; D">
   <audioObjectIDRef>AO_1001</audioObjectIDRef><audioObjectIDRef>AO_1002</audioObjectIDRef>
   <dialogue mixedContentKind="3">2</dialogue>
  </audioContent>
  <audioObject audioObjectID="AO_1001" audioObjectName="Bed" duration="00:00:30.00000" disableDucking="1">
   <audioPackFormatIDRef>AP_00011001</audioPackFormatIDRef>
   <audioObjectIDRef>AO_1002</audioObjectIDRef>
   <audioTrackUIDRef>ATU_00000001</audioTrackUIDRef>
  </audioObject>
  <audioObject audioObjectID="AO_1002" audioObjectName="Circle"><audioObjectIDRef>AO_1002</audioObjectIDRef></audioObject>
  <audioPackFormat audioPackFormatID="AP_00011001" audioPackFormatName="Mono" typeLabel="0001">
   <audioChannelFormatIDRef>AC_00011001</audioChannelFormatIDRef>
   <audioChannelFormatIDRef>AC_00031001</audioChannelFormatIDRef>
  </audioPackFormat>
  <audioChannelFormat audioChannelFormatID="AC_00011001" audioChannelFormatName="Centre" typeDefinition="DirectSpeakers">
   <audioBlockFormat audioBlockFormatID="AB_00011001_00000001">
    <speakerLabel>M+000</speakerLabel><position coordinate="azimuth">12</position>
   </audioBlockFormat>
  </audioChannelFormat>
  <audioChannelFormat audioChannelFormatID="AC_00031001" audioChannelFormatName="Fly" typeLabel="0003">
   <audioBlockFormat audioBlockFormatID="AB_00031001_00000001" rtime="00:00:00.00000" duration="00:00:00.24000S48000">
    <position coordinate="azimuth">30</position><position coordinate="elevation">-1.5</position>
   </audioBlockFormat>
   <audioBlockFormat audioBlockFormatID="AB_00031001_0000000a" rtime="00:00:00.5">
    <cartesian>1</cartesian><position coordinate="X">0.5</position><position coordinate="Y">-0.25</position>
    <gain gainUnit="dB">-6</gain>
   </audioBlockFormat>
  </audioChannelFormat>
  <audioStreamFormat audioStreamFormatID="AS_00011001" audioStreamFormatName="S" formatLabel="0001">
   <audioChannelFormatIDRef>AC_00011001</audioChannelFormatIDRef><audioTrackFormatIDRef>AT_00011001_01</audioTrackFormatIDRef>
  </audioStreamFormat>
  <audioTrackFormat audioTrackFormatID="AT_00011001_01" audioTrackFormatName="T" formatDefinition="PCM">
   <audioStreamFormatIDRef>AS_00011001</audioStreamFormatIDRef>
  </audioTrackFormat>
  <audioTrackUID UID="ATU_00000001" sampleRate="48000" bitDepth="24">
   <audioTrackFormatIDRef>AT_00011001_01</audioTrackFormatIDRef><audioPackFormatIDRef>AP_00011001</audioPackFormatIDRef>
  </audioTrackUID>
 </audioFormatExtended></format></coreMetadata>
</ebuCoreMain>
)";
