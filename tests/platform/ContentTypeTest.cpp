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
    const struct {
        const char* identifier;
        bool isAudio;
        bool isFLAC;
    } cases[] = {
        {"public.audio", true, false},
        {"public.aifc-audio", true, false},
        {"com.microsoft.waveform-audio", true, false},
        {"PUBLIC.MP3", true, false},
        {"org.xiph.flac", true, true},
        {"audio/flac", true, true},
        {"Audio/X-FLAC", true, true},
        {"audio/flac; charset=binary", true, true},
        {"audio/x-caf", true, false}, // no identifier stands for it
        {"audio/vnd.wave;codec=1", true, false},
        {"audio/", false, false},
        {"audio", false, false},
        {"public.movie", false, false},
        {"video/mp4", false, false},
        {"public.data", false, false},
        {"public.audio2", false, false},
        {"application/octet-stream", false, false},
        {"", false, false},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(type(c.identifier).conformsTo(ContentType::audio()), c.isAudio) << c.identifier;
        EXPECT_EQ(type(c.identifier).conformsTo(ContentType::flac()), c.isFLAC) << c.identifier;
    }
    EXPECT_FALSE(ContentType(String()).conformsTo(ContentType::audio()));
}

TEST(ContentType, ConformanceGoesUpThroughEveryParent)
{
    EXPECT_TRUE(type("public.aifc-audio").conformsTo(type("public.aiff-audio")));
    EXPECT_TRUE(type("audio/x-aiff").conformsTo(type("audio/aiff")));
    EXPECT_TRUE(type("audio/x-caf").conformsTo(type("AUDIO/X-CAF")));
    EXPECT_TRUE(type("audio/wav").conformsTo(type("public.item")));
    EXPECT_TRUE(type("audio/wav").conformsTo(type("public.content")));
    EXPECT_FALSE(ContentType::audio().conformsTo(type("public.aiff-audio")));
    EXPECT_FALSE(ContentType::audio().conformsTo(type("audio/x-caf")));
    EXPECT_FALSE(type("audio/x-caf").conformsTo(type("audio/x-mod")));
    EXPECT_FALSE(type("made.up").conformsTo(type("made.up")));
}

} // namespace
