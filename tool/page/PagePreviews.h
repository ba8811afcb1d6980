// Short decoded sounds for browsers that do not play the files themselves.
#pragma once

#include "tool/page/PageRow.h"

#include <string>
#include <vector>

struct PagePreviews {
    enum class Where { none, beside, embedded };
    Where where = Where::none;
    std::string page; // the page's file, of whose name that of the folder beside it is made
    bool quiet = false;

    /// Gives a preview to each row that not every browser plays. False if one could not be made, which is told.
    /// Throws Failure.
    bool make(std::vector<PageRow>& rows) const;
    /// "library-previews", for "library.html".
    std::string folderName() const;
};
