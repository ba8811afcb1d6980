#include "tool/shared/description/FindingWords.h"

#include <fmt/format.h>

namespace {

using Kind = platform::ContainerFinding::Kind;

std::string bytesText(std::uint64_t count)
{
    return fmt::format("{} byte{}", count, count == 1 ? "" : "s");
}

std::string framesText(std::uint64_t count)
{
    return fmt::format("{} frame{}", count, count == 1 ? "" : "s");
}

} // namespace

FindingWords wordsOf(const platform::ContainerFinding& finding)
{
    const std::uint64_t stated = finding.stated, found = finding.found;
    switch (finding.kind) {
    case Kind::containerIsCut:
        return {"containerIsCut", fmt::format("says that it ends at {}, the file ends at {}", stated, found),
                "readers take what is there"};
    case Kind::bytesBehind:
        return {"bytesBehind", fmt::format("says that it ends at {}, {} follow", stated, bytesText(found)),
                "readers pass over what follows, and programs that write may cut it off"};
    case Kind::chunkBehind:
        return {"chunkBehind", fmt::format("stands behind the end of the container, {}", stated),
                "most readers do not find it"};
    case Kind::chunkReachesOut:
        return {"chunkReachesOut", fmt::format("ends at {}, what it stands in at {}", found, stated),
                "some readers cut it there"};
    case Kind::chunkIsShort:
        return {"chunkIsShort", fmt::format("has {}, at least {} belong to it", bytesText(found), stated),
                "readers pass over it, or refuse the file"};
    case Kind::idIsNoName:
        return {"idIsNoName", "has no name of four printable characters", "some readers stop here"};
    case Kind::chunkIsCut:
        return {"chunkIsCut", fmt::format("says {}, {} are there", bytesText(stated), found),
                "readers take what is there, or refuse the file"};
    case Kind::sizeIsOpen:
        return {"sizeIsOpen", fmt::format("has no size; {} follow", bytesText(found)),
                "most readers go on to the end of the file, some find nothing"};
    case Kind::countIsOpen:
        return {"countIsOpen", fmt::format("counts no frames; there are {}", found),
                "readers that go by the count find no sound"};
    case Kind::noChunk:
        return {"noChunk", fmt::format("{} that are no chunk", bytesText(found)),
                "readers stop here, and what stands behind is not found"};
    case Kind::padIsMissing:
        return {"padIsMissing", fmt::format("has {} and no pad byte", bytesText(found)),
                "readers that expect one miss what follows"};
    case Kind::padIsNotZero:
        return {"padIsNotZero", fmt::format("has the pad byte {:#04x}, not 0", found),
                "some readers take it for the start of the next chunk; what follows was not looked at"};
    case Kind::repeated:
        return {"repeated", fmt::format("stands here again, first at {}", stated), "readers take one of them"};
    case Kind::formatIsLate:
        return {"formatIsLate", "stands too late", "readers of streams cannot play the file"};
    case Kind::formatIsMissing:
        return {"formatIsMissing", "is missing, or too short", "nobody knows what the samples are"};
    case Kind::formatIsWrong:
        return {"formatIsWrong", "says what cannot be", "readers refuse the file"};
    case Kind::soundIsMissing:
        return {"soundIsMissing", "is missing", "there is no sound"};
    case Kind::soundIsUneven:
        return {"soundIsUneven", fmt::format("ends {} behind its last frame of {}", bytesText(found), stated),
                "readers drop them"};
    case Kind::framesDiffer:
        return {"framesDiffer", fmt::format("counts {}, there are {}", framesText(stated), found),
                "lengths differ from reader to reader"};
    case Kind::sizes64AreMissing:
        return {"sizes64AreMissing", "has no \"ds64\"", "readers refuse the file, or take its sizes as they stand"};
    case Kind::sizes64Differ:
        return {"sizes64Differ", fmt::format("says {}, the \"ds64\" {}", bytesText(stated), found),
                "lengths differ from reader to reader"};
    case Kind::byteRateDiffers:
        return {"byteRateDiffers", fmt::format("says {} a second, there are {}", bytesText(stated), found),
                "some players show another length"};
    case Kind::factIsMissing:
        return {"factIsMissing", "is missing", "readers estimate the length, or decode to learn it"};
    case Kind::versionIsMissing:
        return {"versionIsMissing", "is missing", "strict readers refuse the file"};
    case Kind::offsetIsWrong:
        return {"offsetIsWrong", fmt::format("begins its samples at {}, of {}", stated, bytesText(found)),
                "readers find no sound, or take it from the start"};
    case Kind::tableIsShort:
        return {"tableIsShort", fmt::format("counts {} further sizes, and has room for {}", stated, found),
                "readers pass over them, or refuse the file"};
    case Kind::digestIsWrong:
        return {"digestIsWrong", fmt::format("has {}, and an MD5 16", bytesText(found)),
                "nobody can compare the sound"};
    case Kind::digestDiffers:
        return {"digestDiffers", "states another MD5 than that of the sound",
                "the sound has changed since, or was damaged"};
    }
    return {"", "", ""};
}
