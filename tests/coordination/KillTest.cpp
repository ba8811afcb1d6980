// Processes killed at chosen and at random moments. KTFILES_KILLS is the number of random kills; targeted kills are a
// fifth of that.
#include "AgentProcess.h"
#include "CoordinationFolder.h"

#include <gtest/gtest.h>

#include <array>
#include <cstdlib>
#include <memory>
#include <random>

#include <signal.h>
#include <unistd.h>

namespace {

class KillTest : public CoordinationFolder {
protected:
    static int kills()
    {
        const char* wanted = std::getenv("KTFILES_KILLS");
        return wanted != nullptr ? std::atoi(wanted) : 200;
    }
};

void expectNoViolation(const AgentProcess& agent)
{
    for (const std::string& line : agent.lines())
        EXPECT_FALSE(line.starts_with("violation") || line.starts_with("error")) << line;
}

} // namespace

struct Victim {
    const char* name;
    const char* held;  // what the first process holds
    const char* asks;  // what the second process asks for in vain
    bool killsHolder;  // otherwise the one that asks
    const char* third; // what a third process asks for behind it
};

constexpr Victim kVictims[] = {
    {"holder of an access", "write", "write", true, "read"},
    {"presenter that is held", "presenterlock 0", "write", true, "read"},
    {"presenter that never answers", "present never", "write", true, "write"},
    {"waiter", "write", "write", false, "write"},
    {"waiting reader", "write", "read", false, "write"},
    {"asker that has the queue", "presenterlock 0", "write", false, "write"},
    {"asker that is parked", "presenterlock 1", "read", false, "read"},
};

TEST_F(KillTest, WhoeverIsKilledLeavesNobodyStuck)
{
    for (int i = 0; i < (kills() + 34) / 35; ++i)
        for (const Victim& victim : kVictims) {
            SCOPED_TRACE(victim.name);
            AgentProcess first(folder()), second(folder()), third(folder());
            if (std::string_view(victim.held) == "present never") {
                first.tell("a present never " + item());
                ASSERT_TRUE(first.expect("a presents"));
            } else {
                ASSERT_TRUE(first.beginsAndGets("a", victim.held, item()));
            }
            second.begin("b", victim.asks, item());
            ASSERT_TRUE(awaitWaiting(second, item(), victim.asks == std::string_view("write")));
            third.begin("c", victim.third, item());
            ASSERT_TRUE(awaitWaiting(third, item(), victim.third == std::string_view("write")));
            if (victim.killsHolder) {
                first.kill();
                second.end("b");
                third.end("c"); // either may come first
                ASSERT_TRUE(second.expect("b out"));
            } else {
                second.kill();
                first.end("a");
            }
            ASSERT_TRUE(third.gets("c"));
        }
}

TEST_F(KillTest, ChurnUnderRandomKillsLeavesNothingViolatedAndNobodyStuck)
{
    constexpr std::size_t kProcesses = 6;
    const unsigned seed = std::random_device()();
    RecordProperty("seed", std::to_string(seed));
    std::mt19937 random(seed);
    std::array<std::unique_ptr<AgentProcess>, kProcesses> agents;
    const auto start = [&](std::size_t i) {
        agents[i] = std::make_unique<AgentProcess>(folder());
        agents[i]->tell("churn " + std::to_string(random() % 1000000) + " " + item() + " " + item("witness"));
    };
    for (std::size_t i = 0; i < kProcesses; ++i)
        start(i);
    for (int killed = 0; killed < kills(); ++killed) {
        usleep(static_cast<useconds_t>(random() % 20000)); // any moment will do
        const std::size_t victim = random() % kProcesses;
        agents[victim]->read(0);
        expectNoViolation(*agents[victim]);
        start(victim);
        for (auto& agent : agents)
            agent->read(0);
    }
    for (auto& agent : agents) { // they still make progress
        agent->clearLines();
        ASSERT_FALSE(agent->expectStart("steps").empty());
    }
    for (auto& agent : agents) {
        EXPECT_TRUE(agent->finish()) << "stuck, seed " << seed;
        expectNoViolation(*agent);
    }
}
