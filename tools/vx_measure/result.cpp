// SPDX-License-Identifier: MIT
#include "tools/vx_measure/result.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <ctime>
#include <iostream>

#include "tools/vx/output_file.h"
#include "tools/vx/text.h"

namespace vx {

ResultFiles::ResultFiles(const MeasureOptions &options) : options_(options) {
    if (!options.plots.empty()) plot_ = std::make_unique<Plot>(options.plots, options.force);
    if (!options.csv.empty() && options.csv != "-") checkMayWrite(options.csv, options.force);
}

void ResultFiles::deliver(const Result &result) {
    std::vector<std::string> made;
    if (plot_) made = plot_->draw(result.table, result.plotCommands);
    if (!options_.csv.empty()) {
        // The CSV beside a picture may be the very one that was asked for.
        const bool written = std::find(made.begin(), made.end(), options_.csv) != made.end();
        OutputFile file(options_.csv, options_.force || written);
        file.writeText(vx::csvText(result.table));
        file.commit();
        if (!written && options_.csv != "-") made.push_back(options_.csv);
    }
    if (options_.common.json) {
        nlohmann::ordered_json json = result.json;
        json["files"] = made;
        std::cout << json.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) << "\n";
    } else if (!options_.common.quiet && options_.csv != "-") {
        std::cout << result.text;
        for (const std::string &file : made) std::cout << "wrote " << file << "\n";
    }
}

void tellPlayed(const MeasureOptions &options, double seconds) {
    if (options.common.json)
        std::cout << nlohmann::ordered_json({{"played", options.play}, {"seconds", seconds}}).dump(2) << "\n";
    else if (!options.common.quiet)
        std::cout << "wrote " << options.play
                  << textf(
                         ", %.2f s. Play it through the chain, record it from its beginning on, and run this again with "
                         "--recorded in place of --play.\n",
                         seconds);
}

nlohmann::ordered_json numberOrNull(double value) {
    return std::isfinite(value) ? nlohmann::ordered_json(value) : nlohmann::ordered_json();
}

std::string whenText() {
    const std::time_t now = std::time(nullptr);
    std::array<char, 64> text = {};
    std::strftime(text.data(), text.size(), "measured %Y-%m-%d %H:%M UTC", std::gmtime(&now));
    return text.data();
}

std::string titleCommands(const std::string &what, const std::string &definition, const std::string &chain) {
    constexpr size_t kWidest = 105;  // letters of the small font that fit
    constexpr size_t kWidestChain = 65;
    std::string small = gnuplotText(definition);
    int lines = 2;
    const size_t cut = small.size() > kWidest ? small.rfind("; ", kWidest) : std::string::npos;
    if (cut != std::string::npos) {
        small.replace(cut, 2, ";\\n");
        ++lines;
    }
    const std::string shortened = chain.size() > kWidestChain ? "..." + chain.substr(chain.size() - kWidestChain) : chain;
    small += "\\n" + gnuplotText(whenText() + (chain.empty() ? "" : ", chain: " + shortened));
    return "set title \"" + gnuplotText(what) + textf("\" noenhanced offset 0,%.1f\n", 0.9 * lines - 0.2) + "set label 99 \"" +
           small +
           textf("\" at graph 0.5,1.0 offset 0,%.1f center noenhanced font ',9' tc rgb '#555555'\nset tmargin %.1f\n",
                 0.85 * lines - 0.1, 2.9 + 0.85 * lines);
}

std::string frequencyAxis(double lowestHz, double highestHz) {
    std::string ticks;
    for (double decade = 1.0; decade < 1e6; decade *= 10.0)
        for (const double step : {1.0, 2.0, 5.0}) {
            const double hz = decade * step;
            const std::string name = hz >= 1000.0 ? textf("%gk", hz / 1000.0) : textf("%g", hz);
            ticks += textf("%s\"%s\" %g", ticks.empty() ? "" : ", ", name.c_str(), hz);
        }
    return textf("set logscale x 10\nset xrange [%.9g:%.9g]\n", lowestHz, highestHz) + "set xtics (" + ticks +
           ")\nset xlabel \"Hz\"\n";
}

std::string frequencyText(double hz) {
    return hz >= 999.5 ? textf("%.3g kHz", hz / 1000.0) : textf("%.3g Hz", hz);
}

}  // namespace vx
