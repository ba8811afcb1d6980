// Who waits for whom, between processes.
#include "AgentProcess.h"
#include "CoordinationFolder.h"

#include <gtest/gtest.h>

namespace {

class ExclusionTest : public CoordinationFolder {};

constexpr const char* kKinds[] = {"read",        "write",      "presenterlock 0", "presenterlock 1", "presenterlock 2",
                                  "coordlock 0", "coordlock 1"};

/// Who waits for whom, by kind: a row for each holder, a column for each newcomer. Acquiring a presenter lock is a
/// coordinated write.
constexpr const char* kWaits[] = {
    ". w w w w . w", // read
    "w w w w w w w", // write
    "w w w w w w w", // presenterlock 0
    "w . . . . w .", // presenterlock 1: readers only
    ". w w w w . w", // presenterlock 2: writers only
    ". w w w w . w", // coordlock 0, reading
    "w w w w w w w", // coordlock 1, writing
};

bool isWriting(const std::string& what)
{
    return what != "read" && what != "coordlock 0";
}

} // namespace

TEST_F(ExclusionTest, TheTableOfTypesHoldsBetweenProcesses)
{
    for (std::size_t row = 0; row < std::size(kKinds); ++row)
        for (std::size_t column = 0; column < std::size(kKinds); ++column) {
            const std::string first = kKinds[row], second = kKinds[column];
            SCOPED_TRACE(first + ", then " + second);
            AgentProcess holder(folder()), comer(folder());
            ASSERT_TRUE(holder.beginsAndGets("a", first, item()));
            comer.begin("b", second, item());
            if (kWaits[row][2 * column] == 'w') {
                ASSERT_TRUE(awaitWaiting(comer, item(), isWriting(second)));
                EXPECT_FALSE(comer.has("b"));
                holder.end("a");
            }
            ASSERT_TRUE(comer.gets("b"));
        }
}

// Each kind of presence has its own byte, and a process may raise several.
TEST_F(ExclusionTest, OfTwoPresenterLocksOfAProcessEachHoldsItsOwnKindsBack)
{
    for (const char* second : {"presenterlock 0", "presenterlock 2"}) {
        SCOPED_TRACE(second);
        AgentProcess holder(folder()), reader(folder()), writer(folder());
        ASSERT_TRUE(holder.beginsAndGets("a", "presenterlock 1", item()));
        ASSERT_TRUE(holder.beginsAndGets("b", second, item()));
        reader.begin("r", "read", item());
        ASSERT_TRUE(awaitWaiting(reader, item(), false));
        writer.begin("w", "write", item());
        ASSERT_TRUE(awaitWaiting(writer, item(), true));
        EXPECT_FALSE(reader.has("r") || writer.has("w"));
        holder.end("b");
        ASSERT_TRUE(writer.gets("w"));
        writer.end("w");
        ASSERT_TRUE(writer.expect("w out"));
        EXPECT_FALSE(reader.has("r"));
        holder.end("a");
        EXPECT_TRUE(reader.gets("r"));
    }
}
