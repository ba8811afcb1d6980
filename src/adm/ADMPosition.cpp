#include "adm/ADMPosition.h"

#include "adm/ADMText.h"

std::string ADMPosition::description() const
{
    if (cartesian)
        return "(x=" + adm::fixedText(X) + ", y=" + adm::fixedText(Y) + ", z=" + adm::fixedText(Z) + ")";
    return "(azimuth=" + adm::fixedText(azimuth) + ", elevation=" + adm::fixedText(elevation) +
           ", distance=" + adm::fixedText(distance) + ")";
}
