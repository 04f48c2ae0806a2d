// SPDX-License-Identifier: MIT
//
// Plots as SVG or PNG, drawn by gnuplot, which is called as a program. The numbers always stand beside the picture as CSV, so that
// anyone can draw them again. Where gnuplot is missing, its script is left instead and the caller is told.
#pragma once

#include <string>
#include <vector>

namespace vx {

// Columns of numbers; NaN is an empty cell.
struct Table {
    std::vector<std::string> columns;
    std::vector<std::vector<double>> rows;
    std::vector<std::string> labels;  // of the rows, as a first column; may be empty
};

std::string csvText(const Table &table);

// The files that a plot makes, all known ahead, so that nothing is written over unasked.
class Plot {
  public:
    // `path` ends in .svg or .png; fails otherwise, and if the picture or its CSV is there and `force` is not given.
    Plot(const std::string &path, bool force);

    const std::string &path() const { return path_; }
    const std::string &csvPath() const { return csvPath_; }

    // Draws `commands`, gnuplot's, behind the head that sets terminal, fonts and grid; $data in them holds the table, columns by
    // blanks. Returns the files that were made, the picture or the script first.
    std::vector<std::string> draw(const Table &table, const std::string &commands) const;

  private:
    std::string path_;
    std::string stem_;
    std::string csvPath_;
    bool force_;
};

// Text inside a gnuplot string in double quotes.
std::string gnuplotText(const std::string &text);

}  // namespace vx
