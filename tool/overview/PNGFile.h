// A PNG file of palette indices, written row by row.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/Raster.h"

#include <memory>
#include <string>

/// Operations throw Failure.
class PNGFile {
public:
    PNGFile(int width, int height, const PictureColors& colors);
    ~PNGFile();
    PNGFile(const PNGFile&) = delete;
    PNGFile& operator=(const PNGFile&) = delete;

    /// The next rows, which are as wide as the file.
    void add(const Raster& rows);
    /// When all rows were added.
    void finish();
    /// The bytes since the last call.
    std::string take();

private:
    struct Writer;
    std::unique_ptr<Writer> writer_;
};
