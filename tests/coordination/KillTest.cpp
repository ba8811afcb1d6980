// Processes that are killed, at moments of our choice and at random ones. KTFILES_KILLS is how many are killed at
// random; the targeted kills are a fifth of that.
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
    const char* held;   // what a first process holds, before the path
    const char* isHeld; // its sign
    const char* asks;   // what a second one asks for, and waits
    bool killsHolder;   // else the one that asks
    const char* third;  // what a third asks for behind it
};

constexpr Victim kVictims[] = {
    {"holder of an access", "a write", "a in", "b write", true, "c read"},
    {"presenter that is held", "a presenterlock 0", "a held", "b write", true, "c read"},
    {"presenter that never answers", "a present never", "a presents", "b write", true, "c write"},
    {"waiter", "a write", "a in", "b write", false, "c write"},
    {"waiting reader", "a write", "a in", "b read", false, "c write"},
    {"asker that has the queue", "a presenterlock 0", "a held", "b write", false, "c write"},
    {"asker that is parked", "a presenterlock 1", "a held", "b read", false, "c read"},
};

TEST_F(KillTest, WhoeverIsKilledLeavesNobodyStuck)
{
    for (int i = 0; i < (kills() + 34) / 35; ++i)
        for (const Victim& victim : kVictims) {
            SCOPED_TRACE(victim.name);
            AgentProcess first(folder()), second(folder()), third(folder());
            first.tell(std::string(victim.held) + " " + item());
            if (std::string(victim.isHeld) == "a held")
                first.tell("a retain");
            ASSERT_TRUE(first.expect(victim.isHeld));
            const auto waitFor = [&](AgentProcess& agent, const std::string& what) {
                agent.tell(what + " " + item());
                return awaitWaiting(agent, item(), what.ends_with("write"));
            };
            ASSERT_TRUE(waitFor(second, victim.asks));
            ASSERT_TRUE(waitFor(third, victim.third));
            if (victim.killsHolder) {
                first.kill();
                second.tell("b leave");
                third.tell("c leave"); // either may be the first
                ASSERT_TRUE(second.expect("b out"));
            } else {
                second.kill();
                first.tell(std::string(victim.isHeld) == "a in" ? "a leave" : "a release");
            }
            ASSERT_TRUE(third.expect("c in"));
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
    for (auto& agent : agents) { // they still get somewhere
        agent->clearLines();
        ASSERT_FALSE(agent->expectStart("steps").empty());
    }
    for (auto& agent : agents) {
        EXPECT_TRUE(agent->finish()) << "stuck, seed " << seed;
        expectNoViolation(*agent);
    }
}
