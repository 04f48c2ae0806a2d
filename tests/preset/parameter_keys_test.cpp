// SPDX-License-Identifier: MIT
//
// The parameter keys of every configuration and content that a slot has presets for.
#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

const std::string kSlot = "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\";

struct Listing : Graph {
    Texts list(const char *apoType = "EFX") {
        std::vector<WideString> keys = {VX_TEXT("left over")};
        host->GetAllParamRegKeysForAPOType(toWide(apoType), keys);
        Texts texts;
        for (const WideString &key : keys) texts.push_back(toUtf8(key));
        return texts;
    }
    Texts sorted(const char *apoType = "EFX") {
        Texts texts = list(apoType);
        std::sort(texts.begin(), texts.end());
        return texts;
    }
    static std::string keyOf(const std::string &middle) { return kSlot + middle + "\\Parameters"; }
};

}  // namespace

TEST_CASE_FIXTURE(Listing, "loose presets give a key for each configuration and content") {
    putPreset(longDocument());
    putPreset(longDocument(), "EFX", "LineOut", "Music");
    putPreset(longDocument(), "EFX", "Headphones");
    putPreset(longDocument(), "MFX", "Speakers");
    open();
    CHECK(sorted() == Texts{keyOf("EFX\\KZNOVA\\Headphones\\GlobalProfile\\AnyContent"),
                            keyOf("EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent"),
                            keyOf("EFX\\KZNOVA\\LineOut\\GlobalProfile\\Music")});
    CHECK(list("MFX") == Texts{keyOf("MFX\\KZNOVA\\Speakers\\GlobalProfile\\AnyContent")});
}

TEST_CASE_FIXTURE(Listing, "the loose walk tells where it looks and what it finds") {
    putPreset(longDocument());
    std::filesystem::create_directories(hostPath(loosePath("EFX", "LineOut", "Folder")));
    open();
    const GraphLog log;
    CHECK(list().size() == 1);
    const std::string folder = "C:\\ProgramData\\Ondrevale\\APO\\7\\EFX\\LineOut";
    CHECK(log.inOrder({"Preset .zip path is empty.", "Iterate through all preset files to find existing configs and contents ...",
                       "Looking into " + folder + " directory for presets.",
                       "Looking for " + folder + "\\AnyContent\\Preset.bin preset file.",
                       "Found preset with registry path " + keyOf("EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent") + "."}));
    CHECK(log.has("Looking for " + folder + "\\Folder\\Preset.bin preset file."));
    CHECK(log.count("File doesn't exist.") == 1);
}

TEST_CASE_FIXTURE(Listing, "a slot without presets has no keys") {
    open();
    const GraphLog log;
    CHECK(list("LFX").empty());
    CHECK(log.has("Directory doesn't exist."));
}

TEST_CASE_FIXTURE(Listing, "below module version 2.0.7.74 the keys have no engine, and the profile in force stands in them") {
    putPreset(longDocument());
    open("EFX", kVersionWithoutEngine);
    host->UserProfileName.set(VX_TEXT("Evening"));
    CHECK(list() == Texts{keyOf("EFX\\LineOut\\Evening\\AnyContent")});
}

TEST_CASE_FIXTURE(Listing, "a package gives a key for each preset of the slot, of whatever package, duplicates included") {
    putPackage(Package()
                   .add("7/7/EFX/LineOut/AnyContent/Preset.bin", writePreset(longDocument()))
                   .add("9/7/EFX/LineOut/AnyContent/Preset.bin")
                   .add("9/7/EFX/Other/Music/OTHER.BIN")
                   .add("7/7/MFX/LineOut/AnyContent/Preset.bin")
                   .add("7/7/efx/LineOut/AnyContent/Preset.bin")
                   .add("EFX/LineOut/AnyContent/Preset.bin")
                   .add("7/7/EFX/LineOut/AnyContent/readme.txt"));
    putPreset(longDocument(), "EFX", "LooseOnly");
    open();
    const GraphLog log;
    CHECK(list() == Texts{keyOf("EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent"),
                          keyOf("EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent"),
                          keyOf("EFX\\KZNOVA\\Other\\GlobalProfile\\Music")});
    CHECK(log.texts() ==
          Texts{"Try to access preset .zip package first ...", "Building array of APO parameter registry keys ...", "Done."});
}

TEST_CASE_FIXTURE(Listing, "a package with presets of other slots alone gives none, and the loose tree is not consulted") {
    putPackage(Package().add("7/7/MFX/LineOut/AnyContent/Preset.bin"));
    putPreset(longDocument());
    open();
    CHECK(list().empty());
}

TEST_CASE_FIXTURE(Listing, "a package without presets gives way to the loose tree") {
    putPackage(Package().add("7/7/EFX/LineOut/AnyContent/readme.txt"));
    putPreset(longDocument());
    open();
    host->EngineShortName.set(VX_TEXT("ENGINE"));
    const GraphLog log;
    CHECK(list() == Texts{keyOf("EFX\\ENGINE\\LineOut\\GlobalProfile\\AnyContent")});
    CHECK(log.inOrder(
        {"No presets found in .zip package.", "Iterate through all preset files to find existing configs and contents ..."}));
    CHECK_FALSE(log.has("Preset .zip path is empty."));
}

TEST_CASE_FIXTURE(Listing, "a damaged package says what is wrong and gives way to the loose tree") {
    putPreset(longDocument());
    putPackage(Package());
    open();
    host->EngineShortName.set(VX_TEXT("ENGINE"));
    const auto loose = [&] { return list().size() == 1; };
    {
        const GraphLog log;
        CHECK(loose());
        CHECK(log.has("The selected zip archive doesn't contain any preset."));
    }
    putFile(packagePath(), Bytes(30));
    {
        const GraphLog log;
        CHECK(loose());
        CHECK(log.has("Failed to read the end record."));
    }
    std::filesystem::remove(hostPath(packagePath()));
    {
        const GraphLog log;
        CHECK(loose());
        CHECK(log.has("Failed to open zip archive with file name '" + toUtf8(packagePath()) + "'."));
    }
}

TEST_CASE_FIXTURE(Listing, "a central header that is damaged is passed over, and those of the maps end the package") {
    Bytes archive = Package().add("7/7/EFX/LineOut/AnyContent/Preset.bin", writePreset(longDocument())).archive();
    putFile(packagePath(), archive);
    open();
    const Bytes signature = {0x50, 0x4B, 0x01, 0x02};
    auto header = std::search(archive.begin(), archive.end(), signature.begin(), signature.end());
    const auto first = header - archive.begin();
    header = std::search(header + 4, archive.end(), signature.begin(), signature.end());
    const auto second = header - archive.begin();
    const auto third = std::search(header + 4, archive.end(), signature.begin(), signature.end()) - archive.begin();
    const std::pair<ptrdiff_t, const char *> damages[] = {
        {first, "Failed to read SSIDMAP zip entry."},
        {second, "Failed to read CHIDMAP zip entry."},
        {third, "Failed to read zip entry #2, reason: 'Zip file signature is not valid.'."},
    };
    for (const auto &[place, text] : damages) {
        Bytes damaged = archive;
        damaged[static_cast<size_t>(place)] ^= 1;
        putFile(packagePath(), damaged);
        const GraphLog log;
        CHECK(list().empty());
        CHECK(log.has(text));
    }
}
