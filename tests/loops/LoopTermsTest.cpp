// Names of notes and modes, and tempos.
#include "loops/VireoLoopTerms.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

TEST(LoopTerms, EveryNameLeadsBackToItsNumber)
{
    int notes = 0, modes = 0;
    for (std::int64_t number = -200; number <= 200; ++number) {
        if (const auto note = VireoLoopNoteName(number); !note.empty() && ++notes) {
            EXPECT_EQ(VireoLoopNoteNamed(note), number) << note;
        }
        if (const auto mode = VireoLoopModeName(number); !mode.empty() && ++modes) {
            EXPECT_EQ(VireoLoopModeNamed(mode), number) << mode;
        }
    }
    EXPECT_EQ(notes, 12);
    EXPECT_EQ(modes, 5);
    EXPECT_EQ(VireoLoopNoteName(49), "Db");
    EXPECT_EQ(VireoLoopNoteName(std::numeric_limits<std::int64_t>::min()), "");
}

TEST(LoopTerms, KeysHaveSeveralNames)
{
    const std::pair<std::string_view, int> notes[] = {{"C", 48},  {"c", 48},  {"B#", 48}, {"Db", 49}, {"C#", 49},
                                                      {"Fb", 52}, {"Gb", 54}, {"bb", 58}, {"B", 59},  {"Cb", 59}};
    for (const auto& [name, note] : notes)
        EXPECT_EQ(VireoLoopNoteNamed(name), note) << name;
    for (const std::string_view none : {"", "H", "#", "C##", "Cm", "C ", "48", "@", "`"})
        EXPECT_EQ(VireoLoopNoteNamed(none), std::nullopt) << none;
    for (const std::string_view none : {"", "Major", "any", "0"})
        EXPECT_EQ(VireoLoopModeNamed(none), std::nullopt) << none;
}

TEST(LoopTerms, NoTempoOfWhatIsNotKnown)
{
    EXPECT_DOUBLE_EQ(VireoLoopTempo(8, 176400, 44100), 120);
    constexpr double none = std::numeric_limits<double>::quiet_NaN(), endless = std::numeric_limits<double>::infinity();
    EXPECT_EQ(VireoLoopTempo(0, 176400, 44100), 0);
    EXPECT_EQ(VireoLoopTempo(-8, 176400, 44100), 0);
    EXPECT_EQ(VireoLoopTempo(8, 0, 44100), 0);
    for (const double rate : {0.0, -44100.0, none, endless})
        EXPECT_EQ(VireoLoopTempo(8, 176400, rate), 0) << rate;
}

} // namespace
