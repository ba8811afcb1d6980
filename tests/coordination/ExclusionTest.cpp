// Who waits for whom, between processes.
#include "AgentProcess.h"
#include "CoordinationFolder.h"

#include <gtest/gtest.h>

namespace {

class ExclusionTest : public CoordinationFolder {};

struct Case {
    const char* holder; // what makes it, before the path
    const char* comer;
    bool waits;
};

constexpr Case kCases[] = {
    {"read", "read", false},
    {"read", "write", true},
    {"write", "read", true},
    {"write", "write", true},
    {"presenterlock 0", "read", true},
    {"presenterlock 0", "write", true},
    {"presenterlock 1", "read", true},
    {"presenterlock 1", "write", false},
    {"presenterlock 2", "read", false},
    {"presenterlock 2", "write", true},
    {"coordlock 0", "read", false},
    {"coordlock 0", "write", true},
    {"coordlock 1", "read", true},
    {"coordlock 1", "write", true},
    {"read", "presenterlock 0", true},
    {"write", "presenterlock 0", true},
    {"read", "presenterlock 1", true},
    {"write", "presenterlock 1", true},
    {"read", "presenterlock 2", true},
    {"write", "presenterlock 2", true},
    {"read", "coordlock 0", false},
    {"write", "coordlock 0", true},
    {"read", "coordlock 1", true},
    {"presenterlock 1", "presenterlock 1", false},
    {"presenterlock 0", "presenterlock 0", true},
    {"presenterlock 2", "coordlock 1", true},
};

bool isAccess(const std::string& what)
{
    return what == "read" || what == "write";
}

/// Acquiring a presenter lock is a coordinated write.
bool isWriting(const std::string& what)
{
    return what != "read" && what != "coordlock 0";
}

void begin(AgentProcess& agent, const std::string& name, const std::string& what, const std::string& path)
{
    agent.tell(name + " " + what + " " + path);
    if (!isAccess(what))
        agent.tell(name + " retain");
}

std::string sign(const std::string& name, const std::string& what)
{
    return name + (isAccess(what) ? " in" : " held");
}

void end(AgentProcess& agent, const std::string& name, const std::string& what)
{
    agent.tell(name + (isAccess(what) ? " leave" : " release"));
    agent.expect(name + (isAccess(what) ? " out" : " releases"));
}

} // namespace

TEST_F(ExclusionTest, TheTableOfTypesHoldsBetweenProcesses)
{
    for (const Case& one : kCases) {
        SCOPED_TRACE(std::string(one.holder) + ", then " + one.comer);
        AgentProcess holder(folder()), comer(folder());
        begin(holder, "a", one.holder, item());
        ASSERT_TRUE(holder.expect(sign("a", one.holder)));
        begin(comer, "b", one.comer, item());
        if (one.waits) {
            ASSERT_TRUE(awaitWaiting(comer, item(), isWriting(one.comer)));
            EXPECT_FALSE(comer.hasSaid(sign("b", one.comer)));
            end(holder, "a", one.holder);
        }
        ASSERT_TRUE(comer.expect(sign("b", one.comer)));
        end(comer, "b", one.comer);
    }
}
