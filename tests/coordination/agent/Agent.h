// A process controlled by the tests: reads commands by line and reports every event by line.
#pragma once

#include "platform/FileCoordination.h"
#include "support/URLs.h"

#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>

/// An object made by a command, under the name given there.
class Actor {
public:
    virtual ~Actor() = default;
    virtual void command(const std::string& verb) = 0;
};

void say(const std::string& line);

/// "read", "write": a coordinated access until the command "leave".
std::unique_ptr<Actor> makeAccess(const std::string& name, bool isWriting, const std::string& path);
/// "presenterlock TYPE", "coordlock TYPE": accept "retain", "release", "state".
std::unique_ptr<Actor> makePresenterLock(const std::string& name, unsigned type, const std::string& path);
std::unique_ptr<Actor> makeCoordinationLock(const std::string& name, unsigned type, const std::string& path);
/// "present BEHAVIOUR": never, twice, drop, save or atonce; accepts "answer" and "unregister".
std::unique_ptr<Actor> makePresenter(const std::string& name, const std::string& behaviour, const std::string& path);

/// Random accesses and locks on the item at `path` until `isOver`, each witnessed by record locks on another file,
/// which the kernel drops before the service's own when a process is killed. Reports "violation" if a witness is in the
/// way.
void churn(unsigned seed, const std::string& path, const std::string& witness, const std::function<bool()>& isOver);
