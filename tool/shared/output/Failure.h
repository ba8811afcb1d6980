// Failures of the command: each becomes one line on standard error, `ktfiles: FILE: what is wrong`.
#pragma once

#include "platform/core/SystemErrorText.h"

#include <cstdint>
#include <stdexcept>
#include <string>

/// What is wrong with one file, in words for people. Thrown inside the command only; the verb that works on the file
/// catches it, reports it and goes on with the next one.
class Failure : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// The Failure of a file that is whole, perhaps, but of another kind than the verb works on.
class OtherKind : public Failure {
public:
    enum class Kind { audio, unknown };
    OtherKind(const std::string& text, Kind kind) : Failure(text), kind_(kind) {}
    /// Else it may be anything.
    bool isAudio() const { return kind_ == Kind::audio; }

private:
    Kind kind_;
};

/// The Failure that standard error has been told of already.
class ToldFailure : public Failure {
public:
    using Failure::Failure;
};

/// Throws the Failure of a status that is not 0.
void requireOK(std::int32_t status);

/// Writes `ktfiles: PATH: TEXT` to standard error, on one line whatever the path holds.
void reportFailure(const std::string& path, const std::string& text);

/// Runs `work` for one file: true, or false after its Failure was reported.
template <class Work>
bool reportingFailures(const std::string& path, Work work)
{
    try {
        work();
        return true;
    } catch (const Failure& failure) {
        reportFailure(path, failure.what());
        return false;
    }
}
