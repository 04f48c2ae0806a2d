// SPDX-License-Identifier: MIT
#include "tools/vx_client/endpoint_choice.h"

#include <doctest/doctest.h>

#include "tools/vx/failure.h"
#include "tools/vx_client/change_stream.h"

using namespace vx::client;

namespace {

Device device(const std::string &id, const std::string &name, int32_t index, uint32_t state = 1) {
    Device result;
    result.idText = id;
    result.name = name;
    result.index = index;
    result.state = state;
    return result;
}

const std::vector<Device> kDevices = {device("{0}.{A}", "Speakers", 0), device("{0}.{B}", "Speakers (USB)", 1, 4),
                                      device("{0}.{C}", "Speakers (dock)", 1, 8), device("{1}.{D}", "7 microphones", 3)};

std::string chosen(const std::string &text) {
    return chooseEndpoint(kDevices, text).idText;
}

}  // namespace

TEST_CASE("a whole name goes before a part of one, and an index before a name") {
    CHECK(chosen("speakers") == "{0}.{A}");
    CHECK(chosen("micro") == "{1}.{D}");
    CHECK(chosen("3") == "{1}.{D}");
    CHECK(chosen("7") == "{1}.{D}");
    CHECK(chosen("{0}.{b}") == "{0}.{B}");
    CHECK(chosen("{c}") == "{0}.{C}");
}

TEST_CASE("of several that fit the only active one is meant, and without one none is") {
    CHECK(chosen("speak") == "{0}.{A}");
    CHECK_THROWS_AS(chosen("1"), vx::Failure);
    CHECK_THROWS_AS(chosen("(usb) "), vx::Failure);
    CHECK_THROWS_AS(chosen(""), vx::Failure);
    CHECK_THROWS_AS(chooseEndpoint({}, "speakers"), vx::Failure);
}

TEST_CASE("change records are taken apart as far as they are whole") {
    std::vector<uint8_t> blob(48 + 3, 0);
    blob[0] = 9;      // source
    blob[16] = 5;     // time
    blob[24] = 3;     // component
    blob[28] = 0xF4;  // id -12
    for (size_t i = 29; i < 32; ++i) blob[i] = 0xFF;
    blob[36] = 3;  // data size
    blob[40] = 1;  // transient
    blob[48] = 7;
    const auto changes = parseChanges(blob.data(), static_cast<uint32_t>(blob.size()), 1);
    REQUIRE(changes.size() == 1);
    CHECK(changes[0].source.Data1 == 9);
    CHECK(changes[0].time == 5);
    CHECK(changes[0].componentId == 3);
    CHECK(changes[0].paramId == -12);
    CHECK(changes[0].transient);
    CHECK(changes[0].data == std::vector<uint8_t>{7, 0, 0});
    for (uint32_t size = 0; size < blob.size(); ++size) CHECK(parseChanges(blob.data(), size, 1).empty());
    CHECK(parseChanges(blob.data(), static_cast<uint32_t>(blob.size()), 9).size() == 1);
    CHECK(parseChanges(nullptr, 48, 1).empty());
}
