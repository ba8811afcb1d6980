// Addresses of files, relative to a page.
#pragma once

#include <string>
#include <string_view>

/// Every byte but letters, digits, "-", ".", "_", "~" and "/" as %XX, so that any name is a part of an address.
std::string percentEncoded(std::string_view path);

/// The address of folder `to` for a page in folder `from`: both absolute, with a slash at the end. Empty for the same
/// folder, else with a slash at the end.
std::string linkToFolder(std::string_view from, std::string_view to);

/// The longest path that all have in common, whole folders only; both end with a slash.
std::string_view commonFolder(std::string_view one, std::string_view other);
