// The interpreter's lock and its signals, as work without the lock needs them.
#pragma once

#include <pybind11/pybind11.h>

/// Gives the interpreter's lock away for as long as it lives. A thread that comes back when the interpreter is shutting
/// down never gets the lock: it stays where it is until the process ends, for there is nothing left to return to.
class Unlocked {
public:
    Unlocked() : state_(PyEval_SaveThread()) {}
    ~Unlocked() noexcept(false);
    Unlocked(const Unlocked&) = delete;
    Unlocked& operator=(const Unlocked&) = delete;

private:
    PyThreadState* state_;
};

/// Takes the lock, as a function that runs without it may, for as long as it lives.
class Locked {
public:
    Locked();
    ~Locked() { PyGILState_Release(state_); }
    Locked(const Locked&) = delete;
    Locked& operator=(const Locked&) = delete;

private:
    PyGILState_STATE state_;
};

/// Lets the handlers of pending signals run, of which the one of Ctrl-C raises KeyboardInterrupt. Called without the
/// lock, now and then, by whatever may take long. Throws pybind11::error_already_set.
void heedSignals();
