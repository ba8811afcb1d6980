#include "platform/posix/Descriptor.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <mutex>
#include <vector>

#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

namespace platform {

namespace {

struct Table {
    std::mutex mutex; // held across a fork, so that every open descriptor is listed
    std::vector<int> open;
    std::array<std::atomic<void*>*, 8> forgotten{};
    std::size_t forgottenCount = 0;

    Table() { pthread_atfork(beforeFork, afterForkInParent, afterForkInChild); }

    static Table& shared()
    {
        static Table& table = *new Table;
        return table;
    }
    static void beforeFork() { shared().mutex.lock(); }
    static void afterForkInParent() { shared().mutex.unlock(); }
    static void afterForkInChild()
    {
        Table& table = shared();
        // The numbers stay open on something harmless, because their owners may still close them in the child.
        for (const int number : table.open) {
            ::close(number);
            const int harmless = ::open("/dev/null", O_RDONLY | O_CLOEXEC);
            if (harmless >= 0 && harmless != number) {
                ::dup3(harmless, number, O_CLOEXEC);
                ::close(harmless);
            }
        }
        for (std::size_t i = 0; i < table.forgottenCount; ++i)
            table.forgotten[i]->store(nullptr, std::memory_order_relaxed);
        table.mutex.unlock();
    }
};

} // namespace

Descriptor::Descriptor(const std::function<int()>& open)
{
    Table& table = Table::shared();
    const std::lock_guard lock(table.mutex);
    table.open.reserve(table.open.size() + 1);
    do
        number_ = open();
    while (number_ < 0 && errno == EINTR);
    if (number_ >= 0)
        table.open.push_back(number_);
}

Descriptor::~Descriptor()
{
    if (number_ < 0)
        return;
    Table& table = Table::shared();
    const std::lock_guard lock(table.mutex);
    const auto found = std::find(table.open.begin(), table.open.end(), number_);
    if (found != table.open.end()) {
        *found = table.open.back();
        table.open.pop_back();
    }
    ::close(number_);
}

void forgetInForkedChild(std::atomic<void*>& pointer)
{
    Table& table = Table::shared();
    const std::lock_guard lock(table.mutex);
    if (table.forgottenCount < table.forgotten.size())
        table.forgotten[table.forgottenCount++] = &pointer;
}

} // namespace platform
