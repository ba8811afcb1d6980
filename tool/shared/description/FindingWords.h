// Words for what is wrong in a container.
#pragma once

#include "media/containers/ContainerCheck.h"

#include <string>

struct FindingWords {
    const char* name;   // as in JSON
    std::string text;   // what is wrong
    const char* effect; // how readers react
};

FindingWords wordsOf(const platform::ContainerFinding& finding);
