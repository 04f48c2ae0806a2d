// SPDX-License-Identifier: MIT
//
// The preset seeds the store, and the store tells which preset did.
#include "tests/preset/seeded_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

}  // namespace

TEST_CASE_FIXTURE(Seeded, "a parameter key is seeded when it is first met, and carries the hash of its preset") {
    CHECK(stored(-1) == Texts{"-18", "-2"});
    CHECK(stored(5) == Texts{"115"});
    CHECK(value(5, 115) == Bytes{1});
    CHECK(storedHash() == hashBytes());
}

TEST_CASE_FIXTURE(Seeded, "the bounds -20 and -21 never reach the store, in any component") {
    CHECK(stored(0).empty());
    CHECK(value(5, -21).empty());
}

TEST_CASE_FIXTURE(Seeded, "what a preset seeds has no source") {
    CHECK_FALSE(keyExists(host->ParamRegKeyName.get() + VX_TEXT("\\5\\Source")));
    CHECK(keyExists(host->ParamRegKeyName.get() + VX_TEXT("\\5\\Time")));
}

TEST_CASE_FIXTURE(Seeded, "a reset deletes what was there, copies the preset and notes its hash") {
    write(5, 115, {7});
    write(9, 9, {9});
    parameters().deleteValue(store_name::presetHash);
    const GraphLog log;
    CHECK(host->ResetParameters(false, false));
    CHECK(value(5, 115) == Bytes{1});
    CHECK(stored(9).empty());
    CHECK(storedHash() == hashBytes());
    const std::string path = toUtf8(host->ParamRegKeyName.get());
    CHECK(log.inOrder({"{ ResetParameters()", "Deleting of 'HKLM\\" + path + "' registry key",
                       "{ LoadPreset(PresetFilePath = " + toUtf8(host->PresetFilePath.get()) + ", LoadPresetFlags = 0x2)",
                       "Saving preset hash in the registry under: " + path + "...", "} ResetParameters()"}));
}

TEST_CASE_FIXTURE(Seeded, "a reset that keeps the power leaves the power parameter out") {
    CHECK(host->ResetParameters(false, true));
    CHECK(stored(-1) == Texts{"-18"});
    CHECK(host->ResetParameters(false, false));
    CHECK(stored(-1) == Texts{"-18", "-2"});
}

TEST_CASE_FIXTURE(Seeded, "a reset of the whole tree deletes everything below the root and seeds this key") {
    const WideString other = VX_TEXT("Software\\Ondrevale\\APO\\VXTEST\\OTHER\\0\\EFX");
    key(other);
    const GraphLog log;
    CHECK(host->ResetParameters(true, false));
    CHECK_FALSE(keyExists(other));
    CHECK(keyExists(kStoreRoot));
    CHECK(value(5, 115) == Bytes{1});
    CHECK(log.has("Deleting content of 'HKLM\\Software\\Ondrevale\\APO' registry key"));
}

TEST_CASE_FIXTURE(Graph, "a reset without a parameter key does nothing") {
    CHECK(host->ResetParameters(true, true));
    CHECK(host->ResetParameter(5, 115, true));
    CHECK_FALSE(keyExists(configurationPath()));
}

TEST_CASE_FIXTURE(Seeded, "a reset whose preset is gone still deletes the key, and writes the object's old hash") {
    std::filesystem::remove(hostPath(host->PresetFilePath.get()));
    const Bytes before = hashBytes();
    CHECK(host->ResetParameters(false, false));
    CHECK(stored(5).empty());
    CHECK(stored(-1).empty());
    CHECK(storedHash() == before);
}

TEST_CASE_FIXTURE(Seeded, "a reset whose preset is damaged keeps what came before the damage, and notes no hash") {
    Bytes image = writePreset(seedDocument());
    image.resize(image.size() - 6);  // in the last block's sizes
    putFile(host->PresetFilePath.get(), image);
    const GraphLog log;
    CHECK(host->ResetParameters(false, false));
    CHECK(stored(-1) == Texts{"-18", "-2"});
    CHECK(storedHash().empty());
    CHECK(log.inOrder({"Preset file is damaged!", "Couldn't open preset file."}));
}

TEST_CASE_FIXTURE(Seeded, "a preset without bypass seeds one that is off") {
    PresetDocument document = seedDocument();
    document.blocks = {{5, 115, 115, {{3}}}};
    putFile(host->PresetFilePath.get(), writePreset(document));
    host->ResetParameters(false, false);
    CHECK(stored(-1) == Texts{"-18"});
    CHECK(value(-1, -18) == Bytes{0});
}

TEST_CASE_FIXTURE(Seeded, "one parameter is restored, and no other") {
    write(5, 115, {7});
    write(-1, -18, {0});
    CHECK(host->ResetParameter(5, 115, false));
    CHECK(value(5, 115) == Bytes{1});
    CHECK(value(-1, -18) == Bytes{0});
}

TEST_CASE_FIXTURE(Seeded, "a parameter that the preset does not hold keeps its stored value") {
    write(5, 99, {7});
    CHECK(host->ResetParameter(5, 99, true));
    CHECK(value(5, 99) == Bytes{7});
}

TEST_CASE_FIXTURE(Seeded, "restoring from a damaged preset is told in the log alone") {
    putFile(host->PresetFilePath.get(), Bytes{1, 2});
    const GraphLog log;
    CHECK(host->ResetParameter(5, 115, false));
    CHECK(log.has("Couldn't open preset file."));
    CHECK(value(5, 115) == Bytes{1});
}

TEST_CASE_FIXTURE(Seeded, "the stored hash is read back") {
    const GraphLog log;
    PresetHash words = {};
    CHECK(host->GetPresetHash(words));
    CHECK(words == host->PresetHash);
    CHECK(log.has("Reading preset file hash from the registry at " + toUtf8(host->ParamRegKeyName.get())));
    CHECK(log.texts().at(2).rfind("Preset hash in the regitry = ", 0) == 0);
}

TEST_CASE_FIXTURE(Seeded, "a hash of another type or size, or none, is not read") {
    PresetHash words = {1};
    RegistryKey opened = parameters();
    for (const size_t size : {0, 31, 33}) {
        opened.setBytes(store_name::presetHash, Bytes(size));
        CHECK_FALSE(host->GetPresetHash(words));
    }
    opened.setText(store_name::presetHash, VX_TEXT("0123456789abcde"));
    const GraphLog log;
    CHECK_FALSE(host->GetPresetHash(words));
    CHECK(log.has("Failed to read preset hash from the registry."));
    opened.deleteValue(store_name::presetHash);
    CHECK_FALSE(host->GetPresetHash(words));
    CHECK(words[0] == 1);
}

TEST_CASE_FIXTURE(Seeded, "the hash of a key that is not there is told so") {
    host->ParamRegKeyName.setSilently(VX_TEXT("Software\\Ondrevale\\APO\\nowhere"));
    const GraphLog log;
    PresetHash words = {};
    CHECK_FALSE(host->GetPresetHash(words));
    CHECK(
        log.has("Failed to read preset hash from the registry. Couldn't open registry key "
                "'HKLM\\Software\\Ondrevale\\APO\\nowhere'"));
}

TEST_CASE_FIXTURE(Seeded, "a key that its preset has seeded is left alone") {
    write(5, 115, {7});
    CHECK_FALSE(host->EnsureParametersAreInRegistry());
    CHECK(value(5, 115) == Bytes{7});
}

TEST_CASE_FIXTURE(Seeded, "a key without a hash counts as not seeded") {
    write(5, 115, {7});
    parameters().deleteValue(store_name::presetHash);
    CHECK(host->EnsureParametersAreInRegistry());
    CHECK(value(5, 115) == Bytes{1});
}

TEST_CASE_FIXTURE(Seeded, "a client that meets a key without a hash reseeds it") {
    write(5, 115, {7});
    parameters().deleteValue(store_name::presetHash);
    Host client;
    client.open(&store, "EFX");
    CHECK(value(5, 115) == Bytes{1});
    CHECK(storedHash() == hashBytes());
}

TEST_CASE_FIXTURE(Seeded, "a client that meets a seeded key takes it as it is") {
    write(5, 115, {7});
    Host client;
    client.open(&store, "EFX");
    CHECK(client.ParamRegKeyName.get() == host->ParamRegKeyName.get());
    CHECK(value(5, 115) == Bytes{7});
}

TEST_CASE_FIXTURE(Seeded, "a client that has another preset of the same name reseeds the key") {
    putPreset(seedDocument(2));
    Host client;
    client.open(&store, "EFX");
    CHECK(value(5, 115) == Bytes{2});
}

TEST_CASE_FIXTURE(Seeded, "without the slot's mutex a reset says so and goes on") {
    write(5, 115, {7});
    host->Mutex.close();
    const GraphLog log;
    CHECK(host->ResetParameters(false, false));
    CHECK(log.has("Mutex handle = NULL!!!"));
    CHECK(value(5, 115) == Bytes{1});
}

TEST_CASE_FIXTURE(Graph, "in a package, too, no preset is loaded where none was chosen") {
    putPackage(Package().add("7/7/MFX/LineOut/AnyContent/Preset.bin", writePreset(seedDocument())));
    open("EFX");
    REQUIRE_FALSE(host->PresetZipPath.get().empty());
    REQUIRE(host->PresetFilePath.get().empty());
    RecordingReceiver receiver;
    CHECK(host->LoadPreset(LOAD_PRESET_PARAMETERS, &receiver));
    CHECK(receiver.values.empty());
}

TEST_CASE_FIXTURE(Graph, "a package's preset seeds like a loose one") {
    putPackage(Package().add("7/7/EFX/LineOut/AnyContent/Preset.bin", writePreset(seedDocument(4))));
    open();
    CHECK(value(5, 115) == Bytes{4});
}
