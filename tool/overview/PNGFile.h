// Writes a PNG file of palette indices row by row.
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

    /// Adds the next rows, which have the file's width.
    void add(const Raster& rows);
    /// Call after all rows were added.
    void finish();
    /// The bytes produced since the last call.
    std::string take();

private:
    struct Writer;
    std::unique_ptr<Writer> writer_;
};
