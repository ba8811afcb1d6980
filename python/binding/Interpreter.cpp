#include "binding/Interpreter.h"

#include <unistd.h>

namespace {

// Python would end the thread by an exception that no destructor may throw.
void stayWhenShuttingDown()
{
    if (_Py_IsFinalizing() != 0)
        for (;;)
            ::pause();
}

} // namespace

Unlocked::~Unlocked() noexcept(false)
{
    stayWhenShuttingDown();
    PyEval_RestoreThread(state_);
}

Locked::Locked()
{
    stayWhenShuttingDown();
    state_ = PyGILState_Ensure();
}

void heedSignals()
{
    const Locked locked;
    if (PyErr_CheckSignals() != 0)
        throw pybind11::error_already_set();
}
