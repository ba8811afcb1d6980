// Pictures of many files on one sheet: a grid of cells, each with a name and a duration below its picture.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/WaveformPicture.h"
#include "tool/shared/edits/OutputFile.h"

#include <optional>
#include <string>
#include <vector>

enum class SheetFormat { png, svg };

/// The format that the name of an output means: ".png" and ".svg" in any case; none for another one.
std::optional<SheetFormat> sheetFormatOf(const std::string& out);

/// What one file comes to: its picture, or the reason why there is none.
struct SheetCell {
    std::string name;     // as the sheet shows it
    std::string duration; // empty: not known
    std::optional<WaveformPicture> picture;
    std::string problem;
};

/// Keeps what is drawn of each file, some kilobytes; the pixels are made row by row of cells when the sheet is written.
class ContactSheet {
public:
    /// `settings` are those of each picture; without a number of columns the sheet gets the shape of a screen.
    ContactSheet(const PictureSettings& settings, std::optional<int> columns) : settings_(settings), columns_(columns)
    {
    }

    void add(SheetCell cell);
    std::size_t count() const { return count_; }

    /// The size in pixels of the sheet with all that was added. Throws Failure where that is beyond what viewers take.
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
    std::size_t count_ = 0; // also of those that are too many to be kept
};
