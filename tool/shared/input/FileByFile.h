// What the verbs that tell of several files have in common.
#pragma once

#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Output.h"

#include <string>
#include <vector>

/// Gives the writer, by its `add`, what `read` says of each file; of one for which that throws Failure the problem, by
/// `addFailure`, and on standard error. Ends with the writer's `finish`. False when a file failed.
template <class Writer, class Read>
bool writeFileByFile(Writer& writer, const std::vector<std::string>& files, Read read)
{
    bool good = true;
    for (const std::string& path : files) {
        if (Output::standard().failed())
            break;
        try {
            writer.add(path, read(path));
        } catch (const Failure& failure) {
            good = false;
            writer.addFailure(path, failure.what());
            reportFailure(path, failure.what());
        }
    }
    writer.finish();
    return good;
}
