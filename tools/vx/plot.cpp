// SPDX-License-Identifier: MIT
#include "tools/vx/plot.h"

#include <cmath>
#include <cstdlib>

#include "tools/vx/output_file.h"
#include "tools/vx/system.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"

namespace vx {
namespace fs = std::filesystem;

namespace {

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
        for (const double value : table.rows[row]) block += std::isnan(value) ? std::string("NaN ") : format("%.9g ", value);
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
            if (!std::isnan(table.rows[row][column])) text += format("%.9g", table.rows[row][column]);
        }
        text += "\n";
    }
    return text;
}

Plot::Plot(const std::string &path, bool force) : path_(path), force_(force) {
    const std::string ending = lowered(utf8Of(pathOf(path).extension()));
    if (ending != ".svg" && ending != ".png")
        throw Failure(ExitStatus::usage, "--plot " + path + ": expected a name that ends in .svg or .png");
    stem_ = path.substr(0, path.size() - ending.size());
    csvPath_ = stem_ + ".csv";
    checkMayWrite(path_, force);
    checkMayWrite(csvPath_, force);
}

std::vector<std::string> Plot::draw(const Table &table, const std::string &commands) const {
    writeWhole(csvPath_, csvText(table), force_);
    const bool svg = lowered(path_).ends_with(".svg");
    // The picture, too, takes its name only when it is whole.
    const OutputFile picture(path_, force_);
    const std::string temporary = utf8Of(picture.writePath());
    const std::string script = stem_ + ".gp";
    const std::string data = dataBlock(table);
    const std::string scratch = temporary + ".gp";
    writeWhole(scratch, head(temporary, svg) + data + commands, true);
    const char *named = std::getenv("VX_GNUPLOT");
    const std::string program = named != nullptr && *named != '\0' ? named : "gnuplot";
    const std::optional<int> status = runProgram({program, scratch});
    std::error_code ignored;
    fs::remove(pathOf(scratch), ignored);
    if (!status) {
        writeWhole(script, head(path_, svg) + data + commands, force_);
        return {script, csvPath_};
    }
    if (*status != 0)
        throw Failure(ExitStatus::system,
                      path_ + ": gnuplot failed with exit status " + std::to_string(*status) + "; the numbers are in " + csvPath_);
    fs::rename(pathOf(temporary), pathOf(path_), ignored);
    if (ignored) throw Failure(ExitStatus::system, path_ + ": cannot be named so: " + ignored.message());
    return {path_, csvPath_};
}

}  // namespace vx
