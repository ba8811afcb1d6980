// The sound files and documents of examples/media, which tests share with the README.
#pragma once

#include <string>

std::string mediaPath(const std::string& name);
