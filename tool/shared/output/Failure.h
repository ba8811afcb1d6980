// Failures of the command: each becomes one line on standard error, `ktfiles: FILE: what is wrong`.
#pragma once

#include "platform/core/SystemErrorText.h"

#include <cstdint>
#include <stdexcept>
#include <string>

/// What is wrong with one file, in words. Thrown inside the command only; the verb that processes the file reports it
/// and continues with the next one.
class Failure : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// The file may be intact but is of a kind that the verb does not process.
class OtherKind : public Failure {
public:
    enum class Kind { audio, unknown };
    OtherKind(const std::string& text, Kind kind) : Failure(text), kind_(kind) {}
    /// Otherwise it may be anything.
    bool isAudio() const { return kind_ == Kind::audio; }

private:
    Kind kind_;
};

/// A Failure that was reported on standard error already.
class ToldFailure : public Failure {
public:
    using Failure::Failure;
};

/// Throws the Failure of a status other than 0.
void requireOK(std::int32_t status);

/// Writes `ktfiles: PATH: TEXT` to standard error, on one line whatever the path contains.
void reportFailure(const std::string& path, const std::string& text);

/// Runs `work` for one file: true, or false after reporting its Failure.
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
