// SPDX-License-Identifier: MIT
#include "diag/format_text.h"

#include <doctest/doctest.h>

#include <array>
#include <random>

using namespace vxcomn;

namespace {

template <class... Arguments>
std::string format(std::string_view text, const Arguments &...arguments) {
    const std::array<FormatArgument, sizeof...(Arguments)> list{FormatArgument(arguments)...};
    return toUtf8(formatText(4095, toWide(text), list));
}

}  // namespace

TEST_CASE("directives print their arguments as printf does") {
    CHECK_EQ(format("%i %d %u", -5, 7, 9U), "-5 7 9");
    CHECK_EQ(format("%x %X %02X %#x", 255, 255, 5, 255), "ff FF 05 0xff");
    CHECK_EQ(format("%s and %s", "narrow", VX_TEXT("wide")), "narrow and wide");
    CHECK_EQ(format("%f %.2f %g", 0.5, 1.0 / 3, 1e9), "0.500000 0.33 1e+09");
    CHECK_EQ(format("[%5i] [%-5i] [%05i] [%5s] [%-5s] [%.2s]", 42, 42, 42, "ab", "ab", "abcd"),
             "[   42] [42   ] [00042] [   ab] [ab   ] [ab]");
    CHECK_EQ(format("%*i|%-*i|", 4, 1, 4, 2), "   1|2   |");
    CHECK_EQ(format("%llu %%", uint64_t{18446744073709551615ULL}), "18446744073709551615 %");
    CHECK_EQ(format("%c%c", 'o', 'k'), "ok");
}

TEST_CASE("a directive without an argument prints nothing and takes nothing") {
    CHECK_EQ(format("100% sure %s %i %n end"), "100ure    end");
    CHECK_EQ(format("%s %s", "one"), "one ");
    CHECK_EQ(format("%"), "");
    CHECK_EQ(format("%%"), "%");
    CHECK_EQ(format("%5"), "");
    CHECK_EQ(format("%.*f"), "");
}

TEST_CASE("an argument of another type than its directive prints in its own way") {
    CHECK_EQ(format("%s %i %f", 5, "text", 7), "5 text 7");
    CHECK_EQ(format("%i", 2.5), "2.500000");
    CHECK_EQ(format("%s", static_cast<const char *>(nullptr)), "(null)");
    CHECK_EQ(format("%u", int8_t{-1}), "255");
    CHECK_EQ(format("%i", true), "1");
}

TEST_CASE("widths and precisions beyond all measure are held to the line's buffer") {
    CHECK_EQ(format("%999999999999i", 1).size(), 4095);
    CHECK_EQ(format("%.999999999f", 1.0).size(), 4095);
    CHECK(format("%*s", -2000000000, "x").size() <= 4096);
}

TEST_CASE("random formats and arguments end within the limit") {
    std::mt19937 random(1);
    const std::string units = "%%%%sdixXfgcn*.-+ #0123456789lhzI64abc";
    for (int round = 0; round < 20000; ++round) {
        std::string text;
        for (unsigned i = 0; i < random() % 12; ++i) text.push_back(units[random() % units.size()]);
        const FormatArgument arguments[] = {static_cast<int32_t>(random()), "text", 1.5, VX_TEXT("wide")};
        const WideString line = formatText(64, toWide(text), {arguments, random() % 5});
        REQUIRE(line.size() <= 64);
    }
}
