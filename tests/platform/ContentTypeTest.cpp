#include "platform/ContentType.h"

#include <gtest/gtest.h>

namespace {

using platform::ContentType;
using platform::String;

ContentType type(const char* identifier)
{
    return ContentType(String::fromUTF8(identifier));
}

TEST(ContentType, AudioAndFLAC)
{
    const auto expect = [](std::initializer_list<const char*> identifiers, bool isAudio, bool isFLAC) {
        for (const char* identifier : identifiers) {
            EXPECT_EQ(type(identifier).conformsTo(ContentType::audio()), isAudio) << identifier;
            EXPECT_EQ(type(identifier).conformsTo(ContentType::flac()), isFLAC) << identifier;
        }
    };
    expect({"org.xiph.flac", "audio/flac", "Audio/X-FLAC", "audio/flac; charset=binary"}, true, true);
    expect({"public.audio", "public.aifc-audio", "com.example.waveform-audio", "PUBLIC.MP3", "audio/vnd.wave;codec=1",
            "com.example.someaudio-format", // as vendors call CAF
            "audio/x-caf"},                 // no identifier stands for the last
           true, false);
    expect({"audio/", "audio", "public.movie", "video/mp4", "public.data", "public.audio2", "application/octet-stream",
            "", "my-audio", "public.other-audio", "com.example.audio-format.list"},
           false, false);
    EXPECT_FALSE(ContentType(String()).conformsTo(ContentType::audio()));
}

} // namespace
