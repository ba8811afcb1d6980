// ktfiles.lock: coordinated access that is held for as long as Python wants it.
#include "binding/Bindings.h"
#include "binding/Coordination.h"
#include "binding/Interpreter.h"

#include <pybind11/stl.h>

#include <mutex>

namespace py = pybind11;

namespace {

/// Held or not; any thread may let it go.
class Lock {
public:
    Lock(std::string path, bool isWriting) : path_(std::move(path)), isWriting_(isWriting) {}

    /// False where it is held already.
    bool acquire(Timeout timeout)
    {
        const Unlocked unlocked;
        {
            const std::lock_guard lock(mutex_);
            if (held_ || isWaiting_)
                return false;
            isWaiting_ = true;
        }
        std::unique_ptr<HeldAccess> held;
        try {
            held = std::make_unique<HeldAccess>(path_, isWriting_, timeout);
        } catch (...) {
            const std::lock_guard lock(mutex_);
            isWaiting_ = false;
            throw;
        }
        const std::lock_guard lock(mutex_);
        isWaiting_ = false;
        held_ = std::move(held);
        return true;
    }
    /// False where it is not held.
    bool release()
    {
        const Unlocked unlocked;
        std::unique_ptr<HeldAccess> given;
        const std::lock_guard lock(mutex_);
        given.swap(held_);
        return given != nullptr;
    }
    bool isHeld()
    {
        const Unlocked unlocked;
        const std::lock_guard lock(mutex_);
        return held_ != nullptr;
    }

private:
    const std::string path_;
    const bool isWriting_;
    std::mutex mutex_;
    bool isWaiting_ = false;
    std::unique_ptr<HeldAccess> held_;
};

} // namespace

void bindLocks(py::module_& module)
{
    module.def("set_coordination_folder", &platform::FileCoordinator::setCoordinationFolder, py::arg("path"));
    py::class_<Lock>(module, "Lock")
        .def(py::init<std::string, bool>(), py::arg("path"), py::arg("write"))
        .def("acquire", &Lock::acquire, py::arg("timeout"))
        .def("release", &Lock::release)
        .def_property_readonly("held", &Lock::isHeld);
}
