// SPDX-License-Identifier: MIT
//
// The preset and package readers, with each allocation and each file operation in turn failing.
#include <doctest/doctest.h>

#include <filesystem>
#include <fstream>

#include "preset/file_source.h"
#include "tests/fault/posix/faults.h"
#include "tests/preset/package_files.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using test::FaultKind;
namespace fs = std::filesystem;

namespace {

struct File {
    explicit File(const Bytes &bytes) : path(fs::temp_directory_path() / ("vxcomn-fault-" + std::to_string(getpid()))) {
        std::ofstream(path, std::ios::binary)
            .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    }
    ~File() { fs::remove(path); }
    fs::path path;
};

int openFiles() {
    return static_cast<int>(std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator()));
}

void failEachIn(const PresetLocation &where) {
    const auto load = [&where](RecordingReceiver &receiver) {
        RecordingLog log;
        RecordingOwner owner;
        OpenedPreset opened = OpenPresetFile(where, openFileSource, &log);
        return opened &&
               loadPreset(*opened.stream, opened.size, LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS, owner, &receiver, &log)
                   .succeeded();
    };
    RecordingReceiver whole;
    REQUIRE(load(whole));
    REQUIRE(!whole.values.empty());
    const int files = openFiles();
    for (const FaultKind kind : {FaultKind::allocation, FaultKind::file}) {
        bool loaded = false;
        std::optional<RecordingReceiver> receiver;
        const int failures = test::failEach(
            kind, [&] { receiver.emplace(); },
            [&] {
                loaded = false;
                try {
                    loaded = load(*receiver);
                } catch (const std::bad_alloc &) {
                }
            },
            [&](bool failed) {
                CHECK((loaded || failed));
                // What was delivered is what stands there, as far as it goes. Kept: a package's entry whose own header cannot be
                // read is taken from a wrong place; such a load says that it failed.
                if (loaded) CHECK(receiver->values == whole.values);
                if (kind == FaultKind::allocation) {
                    REQUIRE(receiver->values.size() <= whole.values.size());
                    for (size_t i = 0; i < receiver->values.size(); ++i) CHECK(receiver->values[i] == whole.values[i]);
                }
                CHECK(openFiles() == files);
            });
        CHECK(failures > 0);
        MESSAGE(failures << " failures of kind " << static_cast<int>(kind));
    }
}

}  // namespace

TEST_CASE("a loose preset that is read with a failure delivers what it could and nothing else") {
    const File file(writePreset(shortDocument()));
    failEachIn({{}, toWide(file.path.string()), {}});
}

TEST_CASE("a package that is read with a failure delivers all, or says that it failed") {
    const File file(twoModels().archive());
    failEachIn({toWide(file.path.string()), kEfxPath, VX_TEXT("SUBSYS_1234ABCD")});
}
