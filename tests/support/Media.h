// The sound files and documents of examples/media, shared with the README.
#pragma once

#include <string>

std::string mediaPath(const std::string& name);
