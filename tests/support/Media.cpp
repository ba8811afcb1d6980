#include "support/Media.h"

std::string mediaPath(const std::string& name)
{
    return KTFILES_MEDIA "/" + name;
}
