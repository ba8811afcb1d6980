#include "audiofile/ContainerProblem.h"

#include "platform/core/Status.h"
#include "platform/core/SystemErrorText.h"

namespace {

std::string addStatusText(std::int32_t status)
{
    switch (status) {
    case 0:
        return "the file is not chunk-based";
    case -2:
        return "its container header cannot be read";
    case -3:
        return "the new chunk's header cannot be written";
    case -4:
        return "the new chunk's body cannot be written";
    case -5:
        return "its container header cannot be written";
    case -6:
        return "is not open for writing";
    case -7:
        return "the chunk to replace cannot be removed";
    case -8:
        return "its chunks cannot be walked";
    case -9:
        return "the chunk is too large for the container";
    case kStatusEndOfFile:
        return "its container has a negative size";
    default:
        return StatusText(status);
    }
}

std::string shortText(FourCC id)
{
    std::string text = fourCCText(id);
    text.erase(text.find_last_not_of(' ') + 1);
    return text;
}

} // namespace

std::int32_t ContainerProblem::Status() const
{
    if (kind == Kind::none)
        return kStatusOK;
    if (status < 0)
        return status;
    return systemError != 0 ? PosixErrorToOSErr(systemError) : kStatusParameterError;
}

std::string ContainerProblem::Description() const
{
    switch (kind) {
    case Kind::none:
        break;
    case Kind::status:
        return StatusText(status);
    case Kind::empty:
        return "is empty";
    case Kind::noContainer:
        return "no container known here (RIFF, RF64, BW64, AIFF, AIFC, REX2, CAF)";
    case Kind::unknown:
        return "no audio that can be decoded";
    case Kind::headerCut:
        return "ends within its header";
    case Kind::noFormat:
        return "says nowhere what its samples are (no " + shortText(id) + " chunk)";
    case Kind::noSound:
        return id == 0 ? "no sound" : "no sound (no " + shortText(id) + " chunk)";
    case Kind::noIndex:
        return "says nowhere where its samples are (no " + shortText(id) + " box)";
    case Kind::onlyRead:
        return "containers of its kind are only read (RIFX, Wave64)";
    case Kind::chunks:
        return "its chunks cannot be read";
    case Kind::reading:
        return "cannot be read to compare it: " + SystemErrorText(systemError);
    case Kind::adding: {
        // The container's codes say which step failed; the system's last error often says why.
        const bool isWriting = status <= -3 && status >= -5;
        return addStatusText(status) + (isWriting && systemError != 0 ? ": " + SystemErrorText(systemError) : "");
    }
    case Kind::notRemoved:
        return "the chunk \"" + fourCCText(id) + "\" cannot be removed: its body cannot be read";
    case Kind::notFound:
        return "the chunk is not found as it should be after the edit";
    case Kind::misplaced:
        return "the chunk was not put behind all that is there";
    case Kind::cutShort:
        return "its last chunk is not whole";
    case Kind::changed:
        return "the chunk \"" + fourCCText(id) + "\" is not as it was";
    case Kind::tailChanged:
        return "what stands behind its chunks is not as it was";
    }
    return "";
}
