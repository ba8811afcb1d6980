#include "tool/shared/output/HeadingName.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>

std::string headingName(const std::string& path, const std::string& rest)
{
    constexpr int least = 20;
    const std::optional<int> columns = columnsOfOutput();
    std::string name = printable(path);
    return columns ? shortened(name, std::max(*columns - displayWidth(rest), least)) : name;
}
