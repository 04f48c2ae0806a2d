// SPDX-License-Identifier: MIT
//
// The readers: a 64 KiB preset out of a package of 1,000 entries, beside general zip readers, and a preset of 1,000 parameters
// beside one read of its file.
#include <cstdio>
#include <fstream>

#include <fcntl.h>
#include <minizip/unzip.h>
#include <unistd.h>
#include <zip.h>

#include "bench/store/figures.h"
#include "bench/support/timing.h"
#include "preset/file_source.h"
#include "preset/package_maps.h"
#include "preset/package_reader.h"
#include "preset/package_writer.h"
#include "preset/preset_reader.h"
#include "preset/preset_writer.h"

namespace vxcomn::bench {
namespace {

using Bytes = std::vector<uint8_t>;

// 900 entries in, so that nobody finds it first.
constexpr int kEntries = 1000, kWanted = 900;

std::string entryName(int i) {
    return "7/0/EFX/Output " + std::to_string(i) + "/AnyContent/Preset.bin";
}

PresetDocument documentOf(int parameters, size_t bytes) {
    PresetDocument document;
    for (int begin = 0; begin < parameters; begin += 100) {
        PresetBlock block = {begin / 100, 1, std::min(100, parameters - begin), {}};
        for (int i = block.paramIdMin; i <= block.paramIdMax; ++i) block.values.emplace_back(bytes, static_cast<uint8_t>(i));
        document.blocks.push_back(std::move(block));
    }
    return document;
}

void save(const std::filesystem::path &file, const Bytes &bytes) {
    std::ofstream(file, std::ios::binary)
        .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

class Owner final : public PresetOwner {
  public:
    PresetHash &presetHash() override { return hash_; }
    const WideString &engineShortName() const override { return name_; }
    const EngineConfig &engineConfig() const override { return config_; }
    bool engineLocked() const override { return false; }
    void setEngineShortName(const WideString &) override {}
    void setEngineConfig(const EngineConfig &) override {}

  private:
    PresetHash hash_{};
    WideString name_;
    EngineConfig config_{};
};

struct Receiver final : PresetParameters {
    bool parameter(int32_t, int32_t, int32_t, std::span<const uint8_t> value) override {
        bytes += value.size();
        return true;
    }
    size_t bytes = 0;
};

size_t readWhole(const std::filesystem::path &file, Bytes &buffer) {
    const int descriptor = ::open(file.c_str(), O_RDONLY | O_CLOEXEC);
    const ssize_t size = ::read(descriptor, buffer.data(), buffer.size());
    ::close(descriptor);
    require(size > 0, "the file could not be read");
    return static_cast<size_t>(size);
}

void printPackage(const std::filesystem::path &folder) {
    const Bytes image = writePreset(documentOf(16, 4084));
    require(image.size() >= 65000 && image.size() <= 66000, "the preset is not of 64 KiB");
    std::vector<PackageEntry> entries = {
        {"SSIDMAP.bin", writeSsidMap({}, {36, {{7, std::string("SUBSYS_1234ABCD").append(17, '\0')}}})},
        {"CHIDMAP.bin", writeChidMap({})}};
    const Bytes small(200, 1);
    for (int i = 0; i < kEntries - 2; ++i) entries.push_back({entryName(i), i == kWanted ? image : small});
    const auto archive = writePackage(entries);
    require(archive.has_value(), "the package could not be written");
    const auto file = folder / "package.zip";
    save(file, *archive);
    const std::string name = entryName(kWanted);
    const PresetLocation where = {toWide(file.string()), toWide(name.substr(name.find('/') + 1)), VX_TEXT("SUBSYS_1234ABCD")};
    Bytes held(image.size());

    const std::vector<Figure> figures = timeInTurns({
        {"package",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 const OpenedPreset opened = OpenPresetFile(where, openFileSource, nullptr);
                 require(opened && opened.size == image.size(), "the package has no such preset");
                 const uint64_t begin = opened.stream->position();
                 require(opened.source->readAt(begin, held.data(), held.size()) == held.size(), "the preset is cut off");
             }
             require(held == image, "the package's preset is another");
         }},
        {"libzip",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 zip_t *zip = zip_open(file.c_str(), ZIP_RDONLY, nullptr);
                 require(zip != nullptr, "libzip could not open the package");
                 zip_file_t *entry = zip_fopen(zip, name.c_str(), 0);
                 require(entry != nullptr && zip_fread(entry, held.data(), held.size()) == static_cast<zip_int64_t>(held.size()),
                         "libzip could not read the entry");
                 zip_fclose(entry);
                 zip_close(zip);
             }
             require(held == image, "libzip's preset is another");
         }},
        {"minizip",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 unzFile zip = unzOpen(file.c_str());
                 require(zip != nullptr && unzLocateFile(zip, name.c_str(), 1) == UNZ_OK && unzOpenCurrentFile(zip) == UNZ_OK,
                         "minizip could not open the entry");
                 require(unzReadCurrentFile(zip, held.data(), static_cast<unsigned>(held.size())) == static_cast<int>(held.size()),
                         "minizip could not read the entry");
                 unzCloseCurrentFile(zip);
                 unzClose(zip);
             }
             require(held == image, "minizip's preset is another");
         }},
    });
    const auto ns = [&figures](const char *what) { return nanosecondsOf(figures, what); };
    printRatio("a 64 KiB preset of 1,000 entries", ns("package"), ns("libzip") / ns("package"), "faster than libzip", 20, false);
    printRatio("a 64 KiB preset of 1,000 entries", ns("package"), ns("minizip") / ns("package"), "faster than minizip", 20, false);
}

void printLoad(const std::filesystem::path &folder) {
    const Bytes image = writePreset(documentOf(1000, 8));
    const auto file = folder / "preset.bin";
    save(file, image);
    const PresetLocation where = {{}, toWide(file.string()), {}};
    Bytes buffer(image.size() + 1);
    const std::vector<Figure> figures = timeInTurns({
        {"load",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 const OpenedPreset opened = OpenPresetFile(where, openFileSource, nullptr);
                 require(static_cast<bool>(opened), "the preset could not be opened");
                 Owner owner;
                 Receiver receiver;
                 const auto result = loadPreset(*opened.stream, opened.size, LOAD_PRESET_PARAMETERS, owner, &receiver, nullptr);
                 require(result.delivered >= 1000 && receiver.bytes >= 8000, "the load did not deliver all");
             }
         }},
        {"read",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) require(readWhole(file, buffer) == image.size(), "the file is cut off");
         }},
    });
    const double load = nanosecondsOf(figures, "load"), read = nanosecondsOf(figures, "read");
    printRatio("load a preset of 1,000 parameters", load, load / read, "one read of the file", 3, true);
}

}  // namespace

void printPresetFigures(const std::filesystem::path &folder) {
    printPackage(folder);
    printLoad(folder);
}

}  // namespace vxcomn::bench
