// The sources of the page, which are built into the command (page.cmake).
#pragma once

#include <string_view>

namespace pagesources {

extern const std::string_view document, style, script;

} // namespace pagesources
