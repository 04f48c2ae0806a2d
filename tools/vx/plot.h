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
// The pictures of one description and the numbers beside them, all named ahead, so that nothing is written over unasked.
class Plot {
  public:
    // `paths` end in .svg or .png; fails otherwise, and if a picture or the CSV is there and `force` is not given. The CSV has the
    // first picture's name.
    Plot(const std::vector<std::string> &paths, bool force);

    // Draws `commands`, gnuplot's, behind the head that sets terminal, fonts and grid; $data in them holds the table, columns by
    // blanks. Returns the files that were made. Without gnuplot these are a script for each picture and the CSV, and standard error
    // says so.
    std::vector<std::string> draw(const Table &table, const std::string &commands) const;

  private:
    // False if there is no gnuplot.
    bool drawOne(const std::string &path, const std::string &text) const;

    std::vector<std::string> paths_;
    std::string csvPath_;
    bool force_;
};

// Text inside a gnuplot string in double quotes.
std::string gnuplotText(const std::string &text);

}  // namespace vx
