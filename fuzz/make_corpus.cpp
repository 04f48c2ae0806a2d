// SPDX-License-Identifier: MIT
//
// Makes the seed corpus and the dictionary of every fuzz target with the library's own writers:
//
//     make_corpus FOLDER
//
// leaves FOLDER/<target>/ with seeds and FOLDER/<target>.dict. Run by scripts/fuzz.
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "preset/package_maps.h"
#include "preset/package_writer.h"
#include "preset/preset_writer.h"

using namespace vxcomn;
namespace fs = std::filesystem;

namespace {

using Bytes = std::vector<uint8_t>;

class Corpus {
  public:
    Corpus(const fs::path &root, const std::string &target) : folder_(root / target) {
        fs::create_directories(folder_);
        dictionary_.open(root / (target + ".dict"));
    }
    void seed(const Bytes &bytes) {
        std::ofstream out(folder_ / ("seed-" + std::to_string(seeds_++)), std::ios::binary);
        out.write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    }
    void seed(const std::string &text) { seed(Bytes(text.begin(), text.end())); }
    void word(const std::string &bytes) {
        dictionary_ << '"';
        for (const char byte : bytes) {
            char escaped[5];
            std::snprintf(escaped, sizeof escaped, "\\x%02x", static_cast<unsigned>(static_cast<unsigned char>(byte)));
            dictionary_ << escaped;
        }
        dictionary_ << "\"\n";
    }
    void number(uint32_t value) {
        std::string bytes;
        for (int shift = 0; shift < 32; shift += 8) bytes += static_cast<char>(value >> shift);
        word(bytes);
    }

  private:
    fs::path folder_;
    std::ofstream dictionary_;
    int seeds_ = 0;
};

PresetDocument sampleDocument(uint32_t version) {
    PresetDocument document;
    document.version = version;
    if (document.hasLongHeader()) {
        document.engineName = {'V', 'X', 'O', 'R', 'L', 'O', 0};
        document.engineConfig = {20, 0, 0, 0, 0, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0, 2, 0, 0, 0};
    }
    document.blocks = {{-1, -18, -18, {{1}}},
                       {0, -21, -20, {{0, 0, 64, 65}, {0, 0, 64, 193}}},
                       {5, 115, 118, {{1}, {}, Bytes(13, 7), Bytes(13, 9)}},
                       {2, 4, 3, {}}};
    return document;
}

SsidMap sampleSsids() {
    SsidMap map{36, {{0, "SUBSYS_12345678"}, {1, "SUBSYS_9ABCDEF0"}}};
    for (SsidRecord &record : map.records) record.text.resize(map.recordSize - kRecordIndexBytes);
    return map;
}

ChidMap sampleChids() {
    ChidMap map;
    map.groups = {{1, sampleSsids()}, {2, {}}};
    return map;
}

void makePresets(const fs::path &root) {
    Corpus corpus(root, "preset_fuzz");
    for (const uint32_t version : {0x100002u, 0x1000001u, 0x100000Fu, 0x1000010u}) {
        for (const uint8_t choice : {0x03, 0x0F, 0x27}) {
            Bytes seed = writePreset(sampleDocument(version));
            seed.insert(seed.begin(), choice);
            corpus.seed(seed);
        }
        corpus.number(version);
    }
    for (const uint32_t value : {0x10000u, 0x10001u, 0xFFFFFFFFu, 0x7FFFFFFFu, 0x80000000u, 36u, 72u, 524u, 525u, 0xFFFFFFEEu})
        corpus.number(value);
}

void makePackages(const fs::path &root) {
    Corpus corpus(root, "package_fuzz");
    std::vector<PackageEntry> entries = {{"SSIDMAP.bin", writeSsidMap({}, sampleSsids())},
                                         {"CHIDMAP.bin", writeChidMap(sampleChids())}};
    corpus.seed(writePackage(entries).value());
    for (const uint32_t version : {0x1000001u, 0x1000010u}) {
        entries.push_back(
            {std::to_string(entries.size() - 2) + "/0/EFX/AnyOutput/AnyContent/Preset.bin", writePreset(sampleDocument(version))});
        corpus.seed(writePackage(entries).value());
    }
    for (const uint32_t signature : {kEndSignature, kCentralSignature, kLocalSignature}) corpus.number(signature);
    for (const char *word : {"SSIDMAP.bin", "CHIDMAP.bin", "SUBSYS_12345678", "0/0/EFX", "/0/EFX", "\xff\xff", "\xff\xff\xff\xff"})
        corpus.word(word);
}

void makeMaps(const fs::path &root) {
    Corpus ssids(root, "ssid_map_fuzz"), chids(root, "chid_map_fuzz");
    ssids.seed(writeSsidMap({}, sampleSsids()));
    ssids.seed(writeSsidMap({}, {}));
    chids.seed(writeChidMap(sampleChids()));
    chids.seed(writeChidMap({}));
    for (Corpus *corpus : {&ssids, &chids}) {
        for (const uint32_t value : {0u, 1u, 3u, 4u, 5u, 36u, 0xFFFFFFFFu}) corpus->number(value);
        corpus->word("SUBSYS_");
    }
}

void makeKeys(const fs::path &root) {
    Corpus corpus(root, "endpoint_id_fuzz");
    corpus.seed(std::string("{1}.HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001&SUBSYS_5A170001&REV_1000\\4&1A2B3C&0&0001"));
    corpus.seed(std::string("USB\\VID_1234&PID_5678\\7&1"));
    for (const char *word : {"{", "}.", "\\", "&SUBSYS_", "&"}) corpus.word(word);
}

void makeValueNames(const fs::path &root) {
    Corpus corpus(root, "store_value_name_fuzz");
    for (const char *number : {"0", "-18", "256", "-64", "2147483647", "-2147483648", "2147483648"}) {
        corpus.seed(std::string(number));
        corpus.seed(std::string(number) + ",{CD147EE7-2140-4445-B39A-473D43BE970D}");
    }
    for (const char *word : {"-", ",", "{", "}", "0", "CD147EE7-2140-4445-B39A-473D43BE970D"}) corpus.word(word);
}

}  // namespace

int main(int argc, char **argv) {
    if (argc != 2) {
        std::fputs("usage: make_corpus FOLDER\n", stderr);
        return 2;
    }
    const fs::path root = argv[1];
    makePresets(root);
    makePackages(root);
    makeMaps(root);
    makeKeys(root);
    makeValueNames(root);
    return 0;
}
