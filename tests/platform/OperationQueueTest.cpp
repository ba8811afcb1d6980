#include "platform/OperationQueue.h"

#include <gtest/gtest.h>

#include <chrono>
#include <latch>
#include <memory>
#include <thread>

using namespace platform;
using namespace std::chrono_literals;

// Idle threads end after a second: the second round arrives while those of the first are ending.
TEST(BackgroundWork, IsRunBesideAllOtherAlsoByThreadsThatAreAboutToEnd)
{
    constexpr int kMany = 64;
    for (const auto pause : {0us, 300us}) {
        const auto everybody = std::make_shared<std::latch>(kMany + 1);
        for (int i = 0; i < kMany; ++i) {
            ASSERT_TRUE(runInBackground([everybody] { everybody->arrive_and_wait(); }));
            std::this_thread::sleep_for(pause);
        }
        everybody->arrive_and_wait(); // forever, when any waits for another to end
        std::this_thread::sleep_for(1s - 10ms);
    }
}
