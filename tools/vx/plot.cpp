// SPDX-License-Identifier: MIT
#include "tools/vx/plot.h"

#include <cmath>
#include <cstdlib>
#include <iostream>

#include "tools/vx/failure.h"
#include "tools/vx/output_file.h"
#include "tools/vx/system.h"
#include "tools/vx/text.h"

namespace vx {
namespace fs = std::filesystem;

namespace {

constexpr const char *kSvg = ".svg";

std::string quotedCell(const std::string &text) {
    if (text.find_first_of(",\"\n") == std::string::npos) return text;
    std::string result = "\"";
    for (const char letter : text) result += letter == '"' ? std::string("\"\"") : std::string(1, letter);
    return result + "\"";
}

void writeWhole(const std::string &path, const std::string &text, bool force) {
    OutputFile file(path, force);
    file.writeText(text);
    file.commit();
}

std::string dataBlock(const Table &table) {
    std::string block = "$data << EOD\n";
    for (size_t row = 0; row < table.rows.size(); ++row) {
        if (!table.labels.empty()) block += "\"" + gnuplotText(table.labels[row]) + "\" ";
        for (const double value : table.rows[row]) block += std::isnan(value) ? std::string("NaN ") : textf("%.9g ", value);
        block += "\n";
    }
    return block + "EOD\n";
}

// One description for both endings; only the terminal differs.
std::string head(const std::string &picture, bool svg) {
    const std::string terminal = svg ? "set terminal svg size 800,500 dynamic enhanced font 'DejaVu Sans,13' background 'white'\n"
                                     : "set terminal pngcairo size 800,500 enhanced font 'DejaVu Sans,11' background 'white'\n";
    return "set encoding utf8\n" + terminal + "set output \"" + gnuplotText(picture) + "\"\n" +
           "set border lc rgb '#555555'\nset tics nomirror textcolor rgb '#222222'\nset grid lc rgb '#dddddd' lw 1\n";
}

}  // namespace

std::string gnuplotText(const std::string &text) {
    std::string result;
    for (const char letter : text) {
        if (static_cast<unsigned char>(letter) < 0x20) continue;
        if (letter == '"' || letter == '\\') result += '\\';
        result += letter;
    }
    return result;
}

std::string csvText(const Table &table) {
    std::string text;
    for (size_t column = 0; column < table.columns.size(); ++column)
        text += (column == 0 ? "" : ",") + quotedCell(table.columns[column]);
    text += "\n";
    for (size_t row = 0; row < table.rows.size(); ++row) {
        if (!table.labels.empty()) text += quotedCell(table.labels[row]);
        for (size_t column = 0; column < table.rows[row].size(); ++column) {
            if (column > 0 || !table.labels.empty()) text += ",";
            if (!std::isnan(table.rows[row][column])) text += textf("%.9g", table.rows[row][column]);
        }
        text += "\n";
    }
    return text;
}

Plot::Plot(const std::vector<std::string> &paths, bool force) : paths_(paths), force_(force) {
    for (const std::string &path : paths) {
        const std::string ending = lowered(utf8Of(pathOf(path).extension()));
        if (ending != kSvg && ending != ".png")
            throw Failure(ExitStatus::usage, "--plot " + path + ": expected a name that ends in .svg or .png");
        checkMayWrite(path, force);
    }
    csvPath_ = utf8Of(pathOf(paths.at(0)).replace_extension(".csv"));
    checkMayWrite(csvPath_, force);
}

std::vector<std::string> Plot::draw(const Table &table, const std::string &commands) const {
    const std::string text = dataBlock(table) + commands;
    std::vector<std::string> made;
    for (const std::string &path : paths_) {
        if (drawOne(path, text)) {
            made.push_back(path);
            continue;
        }
        const std::string script = path + ".gp";
        writeWhole(script, head(path, lowered(path).ends_with(kSvg)) + text, force_);
        std::cerr << "vx: " << path << ": gnuplot is not there; install it and run it on " << script << "\n";
        made.push_back(script);
    }
    writeWhole(csvPath_, csvText(table), force_);
    made.push_back(csvPath_);
    return made;
}

bool Plot::drawOne(const std::string &path, const std::string &text) const {
    // Gnuplot writes under a temporary name as well: a picture takes its own only when it is whole.
    OutputFile picture(path, force_);
    picture.closeStream();
    const std::string drawing = utf8Of(picture.writePath());
    const std::string script = drawing + ".gp";
    writeWhole(script, head(drawing, lowered(path).ends_with(kSvg)) + text, true);
    const char *named = std::getenv("VX_GNUPLOT");
    const std::optional<int> status = runProgram({named != nullptr && *named != '\0' ? named : "gnuplot", script});
    std::error_code ignored;
    fs::remove(pathOf(script), ignored);
    if (!status) return false;
    if (*status != 0) throw Failure(ExitStatus::system, path + ": gnuplot failed with exit status " + std::to_string(*status));
    picture.commit();
    return true;
}

}  // namespace vx
