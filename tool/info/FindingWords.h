// What is off in a container, in words.
#pragma once

#include "media/containers/ContainerCheck.h"

#include <string>

struct FindingWords {
    const char* name;   // in JSON
    std::string text;   // what is off
    const char* effect; // what readers do
};

FindingWords wordsOf(const platform::ContainerFinding& finding);
