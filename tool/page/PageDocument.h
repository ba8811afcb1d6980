// The page of a library: one HTML file that needs nothing else.
#pragma once

#include "tool/page/PageRow.h"

#include <string>
#include <vector>

struct PageDocument {
    std::string title;     // empty: the name of the folder that all sounds are in
    std::string folder;    // where the page will be: absolute, with a slash at the end
    bool isServed = false; // by a server that gives sounds by the numbers of their rows

    /// The whole file.
    std::string text(const std::vector<PageRow>& rows) const;
    /// What the page may do, as its Content-Security-Policy says.
    static std::string policy();
};

/// More rows would make a page that browsers are slow with.
inline constexpr std::size_t kMostPageRows = 100'000;
