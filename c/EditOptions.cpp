#include "c/EditOptions.h"

#include "c/Calls.h"

#include <cmath>

namespace {

constexpr std::uint32_t kFirstOptionsSize = 16; // of the first version's ktf_edit_options
constexpr std::uint32_t kEditFlags =
    KTF_EDIT_REPLACE | KTF_EDIT_FORCE | KTF_EDIT_IN_PLACE | KTF_EDIT_BACKUP | KTF_EDIT_KEEP_TIMES | KTF_EDIT_LOCKED;

} // namespace

ktf_status readEditOptions(const char* path, const ktf_edit_options* options, EditSettings& settings)
{
    if (options == nullptr)
        return KTF_OK;
    if (options->size < kFirstOptionsSize || (options->flags & ~kEditFlags) != 0 || std::isnan(options->timeout))
        return failCall(path, KTF_PARAMETER_ERROR, "the options of the edit make no sense");
    settings.flags = options->flags;
    settings.how.inPlace = settings.hasFlag(KTF_EDIT_IN_PLACE);
    settings.how.keepTimes = settings.hasFlag(KTF_EDIT_KEEP_TIMES);
    settings.how.backup = settings.hasFlag(KTF_EDIT_BACKUP);
    settings.how.hasAccess = settings.hasFlag(KTF_EDIT_LOCKED);
    if (options->timeout >= 0)
        settings.how.timeoutSeconds = options->timeout;
    return KTF_OK;
}
