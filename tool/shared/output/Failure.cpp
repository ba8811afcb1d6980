#include "tool/shared/output/Failure.h"

#include "platform/core/Status.h"
#include "tool/shared/output/ProgressLine.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/core.h>

#include <cstdio>

void requireOK(std::int32_t status)
{
    if (status != kStatusOK)
        throw Failure(StatusText(status));
}

void reportFailure(const std::string& path, const std::string& text)
{
    const progressline::Cleared cleared;
    // Not fmt::print, which throws if standard error cannot be written; the work must go on.
    std::fputs(
        fmt::format("ktfiles: {}: {}\n", printableOnError(shownName(path)), printableOnError(shownName(text))).c_str(),
        stderr);
}
