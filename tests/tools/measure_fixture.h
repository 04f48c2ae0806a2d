// SPDX-License-Identifier: MIT
//
// What the tests of vx measure share: a measurement as JSON, and a CSV as columns.
#pragma once

#include <doctest/doctest.h>

#include <nlohmann/json.hpp>
#include <sstream>

#include "tests/tools/vx_fixture.h"

namespace test {

struct MeasureFixture : VxFixture {
    static nlohmann::json measure(std::vector<std::string> arguments, int status = 0) {
        arguments.insert(arguments.begin(), "measure");
        arguments.push_back("--json");
        const Outcome outcome = vx(arguments);
        CAPTURE(outcome.errors);
        CHECK(outcome.status == status);
        return nlohmann::json::parse(outcome.output);
    }

    // The band that holds a frequency.
    static nlohmann::json bandAt(const nlohmann::json &result, double hz) {
        for (const auto &band : result["bands"])
            if (band["lowHz"] <= hz && hz < band["highHz"]) return band;
        return {};
    }

    // Lines of cells.
    std::vector<std::vector<std::string>> readCsv(const std::string &name) const {
        std::vector<std::vector<std::string>> lines;
        std::istringstream text(readBytes(name));
        for (std::string line; std::getline(text, line);) lines.push_back(::vx::split(line, ','));
        return lines;
    }
};

}  // namespace test
