// SPDX-License-Identifier: MIT
#include "tools/vx_measure/curve.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <optional>

#include "tools/vx/failure.h"
#include "tools/vx/system.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr size_t kMostBytes = 4 << 20;
constexpr size_t kFewestPoints = 3;
constexpr double kHighestHz = 1e6;
constexpr double kHighestDb = 1000.0;

struct Columns {
    size_t frequency = 0;
    size_t level = 1;
};

[[noreturn]] void failLine(const std::string &path, size_t line, const std::string &what) {
    throw Failure(ExitStatus::input, path + textf(": line %zu: ", line) + what);
}

std::string readWhole(const std::string &path) {
    const bool standard = path == "-";
    File owned;
    if (!standard) {
        owned = openFile(pathOf(path), "rb");
        if (!owned) throw Failure(ExitStatus::input, path + ": cannot be opened: " + std::strerror(errno));
    }
    std::FILE *file = standard ? binaryInput() : owned.get();
    std::string text(kMostBytes + 1, '\0');
    text.resize(std::fread(text.data(), 1, text.size(), file));
    if (std::ferror(file) != 0) throw Failure(ExitStatus::input, path + ": cannot be read; is it a file?");
    if (text.size() > kMostBytes)
        throw Failure(ExitStatus::input, path + ": is larger than 4 MiB; expected a table of some hundred lines");
    return text;
}

std::string trimmed(const std::string &text) {
    const size_t begin = text.find_first_not_of(" \r\"");
    return begin == std::string::npos ? "" : text.substr(begin, text.find_last_not_of(" \r\"") - begin + 1);
}

std::vector<std::string> cellsOf(std::string line) {
    std::replace_if(
        line.begin(), line.end(), [](char letter) { return letter == ';' || letter == '\t'; }, ',');
    std::vector<std::string> cells = split(line, ',');
    for (std::string &cell : cells) cell = trimmed(cell);
    return cells;
}

std::optional<size_t> columnNamed(const std::vector<std::string> &head, const std::vector<const char *> &names) {
    for (const char *name : names)
        for (size_t column = 0; column < head.size(); ++column)
            if (lowered(head[column]) == name) return column;
    return std::nullopt;
}

Columns columnsOf(const std::string &path, size_t line, const std::vector<std::string> &head) {
    const auto frequency = columnNamed(head, {"centre_hz", "hz", "freq", "frequency"});
    const auto level = columnNamed(head, {"response_db", "level_db", "db", "spl"});
    if (!frequency || !level)
        failLine(
            path, line,
            "names no columns that are known; expected centre_hz, hz, freq or frequency, and response_db, level_db, db or spl");
    return {*frequency, *level};
}

}  // namespace

Curve readCurve(const std::string &path) {
    Curve curve;
    Columns columns;
    bool first = true;
    size_t number = 0;
    for (const std::string &line : split(readWhole(path), '\n')) {
        ++number;
        if (trimmed(line).empty() || line[0] == '#' || line[0] == '*') continue;
        const std::vector<std::string> cells = cellsOf(line);
        if (first && !parseNumber(cells[0])) {
            columns = columnsOf(path, number, cells);
            first = false;
            continue;
        }
        first = false;
        if (cells.size() <= std::max(columns.frequency, columns.level)) failLine(path, number, "has too few columns");
        if (cells[columns.level].empty()) continue;
        const auto hz = parseNumber(cells[columns.frequency]);
        const auto level = parseNumber(cells[columns.level]);
        if (!hz || *hz <= 0.0 || *hz > kHighestHz)
            failLine(path, number, "\"" + cells[columns.frequency] + "\" is no frequency; expected a number of Hz");
        if (!level || std::fabs(*level) > kHighestDb)
            failLine(path, number, "\"" + cells[columns.level] + "\" is no level; expected a number of dB");
        if (!curve.empty() && *hz <= curve.back().hz) failLine(path, number, "frequencies have to rise");
        curve.push_back({*hz, *level});
    }
    if (curve.size() < kFewestPoints)
        throw Failure(ExitStatus::input, path + textf(": holds %zu points; expected at least %zu", curve.size(), kFewestPoints));
    return curve;
}

double levelAt(const Curve &curve, double hz) {
    const auto above = std::find_if(curve.begin(), curve.end(), [hz](const CurvePoint &point) { return point.hz >= hz; });
    if (above == curve.begin()) return curve.front().decibels;
    if (above == curve.end()) return curve.back().decibels;
    const CurvePoint &low = *(above - 1);
    const double share = std::log(hz / low.hz) / std::log(above->hz / low.hz);
    return low.decibels + share * (above->decibels - low.decibels);
}

}  // namespace vx
