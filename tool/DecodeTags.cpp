#include "DecodeTags.h"

#include <fmt/format.h>

#include <cmath>

DecodeTags::DecodeTags(const std::string& path)
{
    try {
        source_ = readLoopSource(path);
    } catch (const NoLoopContainer&) {
        return;
    } catch (const Failure& failure) { // no reason to go without the sound
        problem_ = failure.what();
    }
    if (source_ && source_->isEmpty())
        source_.reset();
}

CarriedTags DecodeTags::carryTo(const std::string& output, const std::string& container, const DecodedSound& sound,
                                double sourceRate, bool isWhole)
{
    CarriedTags carried;
    const bool canHold = container == "AIFF" || container == "CAF";
    const std::string obstacle = !problem_.empty()    ? "they " + problem_
                                 : source_ == nullptr ? ""
                                 : !canHold ? fmt::format("{} holds none", container == "raw" ? "raw sound" : container)
                                 : output.empty() ? "they are put into files only"
                                 : !isWhole       ? "they are true of the whole file only"
                                                  : "";
    if (!obstacle.empty())
        carried.notKept.push_back("its tags are not carried over: " + obstacle);
    if (!obstacle.empty() || source_ == nullptr)
        return carried;
    if (sound.sampleRate != sourceRate && sourceRate > 0)
        scaleTransients(sound.sampleRate / sourceRate);
    try {
        const TagsPlan plan = planTagsCopy(source_, readLoopTags(output), output);
        if (!plan.changes.empty())
            writeTags(output, plan);
        for (const TagChange& change : plan.changes)
            carried.keys.push_back(change.key);
        carried.notKept.insert(carried.notKept.end(), plan.notKept.begin(), plan.notKept.end());
    } catch (const Failure& failure) { // nor a reason to lose it
        carried.notKept.push_back(std::string("its tags are not carried over: ") + failure.what());
    }
    return carried;
}

void DecodeTags::scaleTransients(double factor)
{
    for (VireoLoopTransient& transient : source_->tags.transients)
        transient.setFrame(
            static_cast<std::uint64_t>(std::min(std::round(static_cast<double>(transient.frame()) * factor), 9e18)));
}
