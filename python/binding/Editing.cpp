#include "binding/Editing.h"

#include "binding/Interpreter.h"
#include "binding/Problem.h"

#include <cstdlib>

namespace {

// A link is edited where it leads; presenters know the file by that name too.
std::string resolved(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> found(::realpath(path.c_str(), nullptr), &std::free);
    if (!found)
        throwSystemProblem(path, errno);
    return found.get();
}

} // namespace

std::string editSafely(const std::string& path, const Editing& editing,
                       const std::function<std::optional<EditScope>(const std::string& target)>& plan,
                       const std::function<void(const std::string& copy)>& change)
{
    const std::string target = resolved(path);
    const auto access = accessForEdit(target, editing.inPlace, editing.timeout);
    CContainerEdit edit;
    require(path, edit.Begin(target, {.inPlace = editing.inPlace,
                                      .keepTimes = editing.keepTimes,
                                      .backup = editing.backup,
                                      .waitForLock =
                                          [&](int descriptor, const std::string&) {
                                              return waitForEdits(descriptor, path, editing.timeout);
                                          },
                                      .progress = [](std::int64_t, std::int64_t) { heedSignals(); }}));
    const std::optional<EditScope> scope = plan(edit.Target());
    if (!scope)
        return {};
    const FileProblem problem = edit.Apply(*scope, [&](const std::string& copy) {
        change(copy);
        return kStatusOK;
    });
    require(path, edit.Difference());
    require(path, problem);
    return edit.Backup();
}
