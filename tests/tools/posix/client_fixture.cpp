// SPDX-License-Identifier: MIT
#include "tests/tools/posix/client_fixture.h"

#include "platform/module.h"
#include "platform/registry.h"
#include "preset/package_discovery.h"
#include "preset/store_names.h"
#include "tests/support/sample_machine.h"

namespace test {

namespace fs = std::filesystem;
using namespace vxcomn;

namespace {

const std::string kDevice = "HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001";

RegistryKey made(const std::string &path) {
    RegistryKey key;
    REQUIRE(RegistryKey::create(RegistryRoot::localMachine, toWide(path), RegistryAccess::all, key) == status::ok);
    return key;
}

json sampleEndpoints() {
    std::ifstream file(fs::path(VXCOMN_SOURCE_DIR) / "examples/sample_machine/endpoints.json");
    return json::parse(file)["endpoints"];
}

std::string belowMachine(const std::string &key) {
    return key.substr(key.find('\\') + 1);
}

void putValues(const std::string &path, const json &values) {
    RegistryKey key = made(path);
    for (const auto &[name, value] : values.items()) {
        const bool isText = value["type"] == "REG_SZ";
        const Status status = isText ? key.setText(toWide(name), toWide(value["data"].get<std::string>()))
                                     : key.setU32(toWide(name), value["data"].get<uint32_t>());
        REQUIRE(status == status::ok);
    }
}

void cleanStore() {
    ClientFixture::removeKey(ClientFixture::kStore);
}

}  // namespace

const std::string ClientFixture::kSpeakers =
    "SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\MMDevices\\Audio\\Render\\{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B001}";
const std::string ClientFixture::kStore = "Software\\Ondrevale\\APO";
const std::string ClientFixture::kSpeakersSlot = kStore + "\\" + kDevice + "\\0\\EFX";
const std::string ClientFixture::kSpeakersValues = kSpeakersSlot + "\\VXORLO\\AnyOutput\\GlobalProfile\\AnyContent\\Parameters";

ClientFixture::ClientFixture() : system(vxcomn::testing::hostPath(packageFolder(systemFacts()))) {
    cleanStore();
    for (const json &endpoint : sampleEndpoints()) {
        const std::string key = belowMachine(endpoint["key"].get<std::string>());
        putValues(key, endpoint["values"]);
        putValues(key + "\\Properties", endpoint["properties"]);
    }
    fs::create_directories(system);
    const std::string ending = toUtf8(moduleExtension());
    fs::copy_file(fs::path(builtProgram("vx")).parent_path() / ("SampleEngine" + ending), system / ("VXORLO" + ending),
                  fs::copy_options::overwrite_existing);
    done({"preset", "pack", VXCOMN_SOURCE_DIR "/examples/sample_machine/package.json", "--force", "-o", ::vx::utf8Of(system)});
}

ClientFixture::~ClientFixture() {
    for (const json &endpoint : sampleEndpoints()) removeKey(belowMachine(endpoint["key"].get<std::string>()));
    cleanStore();
    std::error_code ignored;
    fs::remove(system / "VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip", ignored);
    fs::remove(system / ("VXORLO" + toUtf8(moduleExtension())), ignored);
}

std::string ClientFixture::done(const std::vector<std::string> &arguments) {
    const Outcome outcome = vx(arguments);
    CAPTURE(arguments.front());
    CAPTURE(outcome.errors);
    CHECK(outcome.status == 0);
    return outcome.output;
}

json ClientFixture::doneJson(std::vector<std::string> arguments) {
    arguments.push_back("--json");
    return json::parse(done(arguments));
}

void ClientFixture::fails(const std::vector<std::string> &arguments, int status, const std::vector<std::string> &texts) {
    const Outcome outcome = vx(arguments);
    CAPTURE(arguments.back());
    CAPTURE(outcome.errors);
    CHECK(outcome.status == status);
    CHECK(outcome.output == "");
    for (const std::string &text : texts) {
        CAPTURE(text);
        CHECK(has(outcome.errors, text));
    }
}

std::string ClientFixture::get(const std::string &name, const std::string &endpoint) {
    std::string text = done({"get", endpoint, name});
    if (!text.empty()) text.pop_back();
    return text;
}

void ClientFixture::putText(const std::string &key, const std::string &name, const std::string &text) {
    REQUIRE(made(key).setText(toWide(name), toWide(text)) == status::ok);
}

void ClientFixture::putBytes(const std::string &key, const std::string &name, const std::vector<uint8_t> &bytes) {
    REQUIRE(made(key).setBytes(toWide(name), bytes) == status::ok);
}

void ClientFixture::putNumber(const std::string &key, const std::string &name, uint32_t number) {
    REQUIRE(made(key).setU32(toWide(name), number) == status::ok);
}

void ClientFixture::removeKey(const std::string &path) {
    const size_t last = path.find_last_of('\\');
    RegistryKey above;
    if (RegistryKey::open(RegistryRoot::localMachine, toWide(path.substr(0, last)), RegistryAccess::all, above) == status::ok)
        above.deleteTreeBelow(toWide(path.substr(last + 1)));
}

std::string Running::line() {
    const auto line = process_.readLine();
    REQUIRE(line.has_value());
    return *line;
}

json Running::next(const std::string &kind, const std::string &name) {
    for (;;) {
        json event = jsonLine();
        if (event["kind"] == kind && event["name"] == name) return event;
    }
}

}  // namespace test
