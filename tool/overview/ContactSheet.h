// Pictures of many files on one sheet: a grid of cells, each with name and duration below its picture.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/WaveformPicture.h"
#include "tool/shared/edits/OutputFile.h"

#include <optional>
#include <string>
#include <vector>

enum class SheetFormat { png, svg };

/// The format of an output's name: ".png" and ".svg" in any case; none for others.
std::optional<SheetFormat> sheetFormatOf(const std::string& out);

/// The result for one file: its picture, or the reason why there is none.
struct SheetCell {
    std::string name;     // as shown on the sheet
    std::string duration; // empty if unknown
    std::optional<WaveformPicture> picture;
    std::string problem;
};

/// Keeps some kilobytes for each file; pixels are made row by row of cells while the sheet is written.
class ContactSheet {
public:
    /// `settings` apply to each picture; without a number of columns the sheet has the shape of a screen.
    ContactSheet(const PictureSettings& settings, std::optional<int> columns) : settings_(settings), columns_(columns)
    {
    }

    void add(SheetCell cell);
    std::size_t count() const { return count_; }

    /// Size in pixels of the sheet with all pictures added. Throws Failure if that exceeds what viewers accept.
    struct Size {
        int width = 0, height = 0;
    };
    Size size() const;

    void write(SheetFormat format, const PictureColors& colors, const Sink& sink) const;

private:
    int columns() const;
    int rows() const;
    int cellWidth() const;
    int cellHeight() const;
    void writePNG(const PictureColors& colors, const Sink& sink) const;
    void writeSVG(const PictureColors& colors, const Sink& sink) const;

    PictureSettings settings_;
    std::optional<int> columns_;
    std::vector<SheetCell> cells_;
    std::size_t count_ = 0; // includes those that are too many to be kept
};
