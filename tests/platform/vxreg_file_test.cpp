// SPDX-License-Identifier: MIT
//
// vxreg export and import: a round trip is exact, and a file with a mistake is refused at its line and changes nothing.
#include <doctest/doctest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "tests/platform/registry_fixture.h"

using namespace vxcomn;
using test::Outcome;
namespace fs = std::filesystem;
using Bytes = std::vector<uint8_t>;

namespace {

const std::string kDone = "The operation completed successfully.\n";
const std::string kHeading = "Windows Registry Editor Version 5.00\r\n\r\n";

struct Fixture : test::RegistryFixture {
    std::string shortName = "HKCU\\" + toUtf8(path);
    std::string longName = "HKEY_CURRENT_USER\\" + toUtf8(path);
    fs::path file = fs::temp_directory_path() / ("vxreg-" + std::to_string(test::processId()) + ".reg");

    Fixture() { fs::remove(file); }
    ~Fixture() { fs::remove(file); }

    static Outcome vxreg(const std::vector<std::string> &arguments, const std::string &input = {}) {
        return test::run(test::builtProgram("vxreg"), arguments, input);
    }
    Outcome exportIt(const std::string &input = {}) const { return vxreg({"export", shortName, file.string()}, input); }
    Outcome import(const std::string &text) const {
        std::ofstream(file, std::ios::binary) << text;
        return vxreg({"import", file.string()});
    }
    std::string bytesOfFile() const {
        std::ifstream in(file, std::ios::binary);
        return {std::istreambuf_iterator<char>(in), {}};
    }
    // What the file says, as UTF-8 without its mark.
    std::string text() const {
        const std::string bytes = bytesOfFile();
        REQUIRE(bytes.size() % 2 == 0);
        REQUIRE(bytes.starts_with("\xFF\xFE"));
        WideString wide;
        for (size_t i = 2; i < bytes.size(); i += 2) {
            wide += static_cast<VXWCHAR>(static_cast<uint8_t>(bytes[i]) | static_cast<uint8_t>(bytes[i + 1]) << 8);
        }
        return toUtf8(wide);
    }
    std::string inKey(const std::string &lines) const { return kHeading + "[" + longName + "]\r\n" + lines; }

    // Everything in the key, for comparing.
    std::vector<std::pair<WideString, RegistryValue>> contents() const {
        std::vector<std::pair<WideString, RegistryValue>> all;
        collect(key, {}, all);
        std::sort(all.begin(), all.end(), [](const auto &a, const auto &b) { return a.first < b.first; });
        return all;
    }
    static void collect(const RegistryKey &from, const WideString &prefix, std::vector<std::pair<WideString, RegistryValue>> &all) {
        all.push_back({prefix, {}});
        std::vector<RegistryEntry> entries;
        CHECK(from.entries(SIZE_MAX, entries) == status::ok);
        for (const RegistryEntry &entry : entries) all.push_back({prefix + VX_TEXT(":") + entry.name, entry.value});
        std::vector<WideString> names;
        CHECK(from.subkeys(names) == status::ok);
        for (const WideString &name : names) {
            RegistryKey below;
            CHECK(from.openBelow(name, RegistryAccess::read, below) == status::ok);
            collect(below, prefix + VX_TEXT("\\") + name, all);
        }
    }
    void empty() {
        key.close();
        RegistryKey software;
        RegistryKey::open(kRoot, VX_TEXT("Software"), RegistryAccess::all, software);
        REQUIRE(software.deleteTreeBelow(ownName) == status::ok);
        REQUIRE(RegistryKey::create(kRoot, path, RegistryAccess::all, key) == status::ok);
    }
};

bool same(const std::vector<std::pair<WideString, RegistryValue>> &left,
          const std::vector<std::pair<WideString, RegistryValue>> &right) {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(), [](const auto &a, const auto &b) {
        return a.first == b.first && a.second.type == b.second.type && a.second.data == b.second.data;
    });
}

}  // namespace

TEST_CASE_FIXTURE(Fixture, "an export is UTF-16 with a mark, and reads as the system's own tool would write it") {
    REQUIRE(key.setText({}, VX_TEXT("own")) == status::ok);
    RegistryKey below;
    REQUIRE(key.createBelow(VX_TEXT("A b]"), RegistryAccess::all, below) == status::ok);
    // In the order of their names, which is the order of some registries.
    REQUIRE(below.setText(VX_TEXT("a\\\"b"), VX_TEXT("C:\\x \"y\" \u00fc")) == status::ok);
    REQUIRE(below.setBytes(VX_TEXT("Bytes"), Bytes(40, 0xAB)) == status::ok);
    REQUIRE(below.setU32(VX_TEXT("d"), 0x1F) == status::ok);
    REQUIRE(below.setU64(VX_TEXT("q"), 0x0102030405060708) == status::ok);
    const Outcome exported = exportIt();
    CHECK(exported.output == kDone);
    CHECK(exported.errors == "");
    CHECK(exported.status == 0);
    std::string row = "\"Bytes\"=hex:";
    for (int i = 0; i < 21; ++i) row += "ab,";
    row += "ab,\\\r\n  ";
    for (int i = 0; i < 17; ++i) row += "ab,";
    CHECK(text() == kHeading + "[" + longName + "]\r\n@=\"own\"\r\n\r\n[" + longName +
                        "\\A b]]\r\n\"a\\\\\\\"b\"=\"C:\\\\x \\\"y\\\" \xC3\xBC\"\r\n" + row +
                        "ab\r\n\"d\"=dword:0000001f\r\n\"q\"=hex(b):08,07,06,05,04,03,02,01\r\n\r\n");
}

TEST_CASE_FIXTURE(Fixture, "export and import give everything back exactly") {
    RegistryKey below, deeper;
    REQUIRE(key.createBelow(VX_TEXT("[-odd;=\"@ key]"), RegistryAccess::all, below) == status::ok);
    REQUIRE(key.createBelow(VX_TEXT("nothing\\in\\it"), RegistryAccess::all, deeper) == status::ok);
    const auto text = [](const WideString &units) {
        Bytes bytes(units.size() * 2);
        std::copy_n(reinterpret_cast<const uint8_t *>(units.data()), bytes.size(), bytes.data());
        return bytes;
    };
    using Type = RegistryType;
    int number = 0;
    for (const Type type : {Type::none, Type::sz, Type::expandSz, Type::binary, Type::dword, Type::multiSz, Type::qword}) {
        for (const Bytes &data :
             {Bytes{}, Bytes{1}, Bytes{0, 0}, Bytes{1, 2, 3, 4}, Bytes(8, 9), Bytes(300, 7), Bytes{'a', 0, 0, 0},
              text(WideString(VX_TEXT("two\r\nlines\0"), 11)), text(WideString(VX_TEXT("a\0b\0"), 4)),
              text(WideString({0xD800, 0})), text(WideString(VX_TEXT("  \\ \" ; \0"), 9))}) {
            const WideString name = toWide("v" + std::to_string(number++));
            REQUIRE(below.set(name, type, data) == status::ok);
        }
    }
    for (const WideString &name :
         {WideString(VX_TEXT("")), WideString(VX_TEXT("quote\"back\\slash")), WideString(VX_TEXT("a\r\nb")),
          WideString({0xDC00, 'x'}), WideString(300, 'n'), WideString(VX_TEXT("=")), WideString(VX_TEXT("@"))}) {
        REQUIRE(below.setU32(name, 1) == status::ok);
    }
    const auto before = contents();
    REQUIRE(exportIt().status == 0);
    empty();
    const Outcome imported = vxreg({"import", file.string()});
    CHECK(imported.errors == "");
    CHECK(imported.output == kDone);
    CHECK(imported.status == 0);
    CHECK(same(contents(), before));
    const std::string first = bytesOfFile();
    REQUIRE(vxreg({"export", shortName, file.string(), "/y"}).status == 0);
    CHECK(bytesOfFile().size() == first.size());
}

TEST_CASE_FIXTURE(Fixture, "import reads UTF-8 with or without a mark, either line end, comments, blanks and folds") {
    for (const std::string mark : {"", "\xEF\xBB\xBF"}) {
        empty();
        const Outcome imported =
            import(mark + "Windows Registry Editor Version 5.00\n; a comment\n\n  [" + longName +
                   "\\sub]  \n  \"n\xC3\xBC\" = \"t\xC3\xA9\"\t\n@=dword:A\n\"b\"=hex:1,02 , ff,\\\n   aB\n\"e\"=hex(7):");
        CHECK(imported.errors == "");
        CHECK(imported.status == 0);
        RegistryKey sub;
        REQUIRE(key.openBelow(VX_TEXT("sub"), RegistryAccess::read, sub) == status::ok);
        WideString text;
        uint32_t number = 0;
        Bytes bytes;
        CHECK(sub.readText(VX_TEXT("n\u00fc"), text) == RegistryRead::value);
        CHECK(text == VX_TEXT("t\u00e9"));
        CHECK(sub.readU32({}, number) == RegistryRead::value);
        CHECK(number == 10);
        CHECK(sub.readBytes(VX_TEXT("b"), bytes, 10) == RegistryRead::value);
        CHECK(bytes == Bytes{1, 2, 0xFF, 0xAB});
        RegistryValue value;
        CHECK(sub.query(VX_TEXT("e"), value) == status::ok);
        CHECK(value.type == RegistryType::multiSz);
        CHECK(value.data.empty());
    }
}

TEST_CASE_FIXTURE(Fixture, "import deletes keys and values where the file says so, whether they are there or not") {
    RegistryKey below;
    REQUIRE(key.createBelow(VX_TEXT("gone\\deep"), RegistryAccess::all, below) == status::ok);
    REQUIRE(key.setU32(VX_TEXT("old"), 1) == status::ok);
    REQUIRE(key.setU32(VX_TEXT("stays"), 1) == status::ok);
    for (int round = 0; round < 2; ++round) {
        CHECK(import(inKey("\"old\"=-\r\n") + "[-" + longName + "\\gone]\r\n").status == 0);
        CHECK(key.openBelow(VX_TEXT("gone"), RegistryAccess::read, below) == status::fileNotFound);
        std::vector<WideString> names;
        CHECK(key.values(names) == status::ok);
        CHECK(names == std::vector<WideString>{VX_TEXT("stays")});
    }
}

TEST_CASE_FIXTURE(Fixture, "a file with a mistake is refused with its line, and nothing of it is written") {
    struct Case {
        std::string text;
        int line;
    };
    const std::string good = inKey("\"good\"=\"x\"\r\n");
    const std::string deep(256, 'k');
    const Case cases[] = {
        {"", 1},
        {"REGEDIT4\r\n", 1},
        {"[" + longName + "]\r\n", 1},
        {kHeading + "\"v\"=\"x\"\r\n", 3},
        {kHeading + "[HKEY_NOBODY\\x]\r\n", 3},
        {kHeading + "[]\r\n", 3},
        {kHeading + "[\r\n", 3},
        {kHeading + "[-HKEY_CURRENT_USER]\r\n", 3},
        {good + "[" + longName + "\r\n", 5},
        {good + "[" + longName + "\\]\r\n", 5},
        {good + "[" + longName + "\\a\\\\b]\r\n", 5},
        {good + "[" + longName + "\\" + deep + "]\r\n", 5},
        {good + "[" + longName + std::string("\\a\0b]\r\n", 7), 5},
        {good + "[-" + longName + "\\x]\r\n\"v\"=\"x\"\r\n", 6},
        {good + "nonsense\r\n", 5},
        {good + "\"v\"\r\n", 5},
        {good + "\"v\"=\r\n", 5},
        {good + "\"v\"=x\r\n", 5},
        {good + "\"v\"=\"x\" y\r\n", 5},
        {good + "\"v\"=\"x\r\n\r\n", 5},
        {good + "\"v\"=\"x\\", 5},
        {good + "\"" + std::string(16384, 'n') + "\"=-\r\n", 5},
        {good + std::string("\"a\0b\"=-\r\n", 9), 5},
        {good + "\"v\"=dword:\r\n", 5},
        {good + "\"v\"=dword:123456789\r\n", 5},
        {good + "\"v\"=dword:1g\r\n", 5},
        {good + "\"v\"=hex(7:00\r\n", 5},
        {good + "\"v\"=hex():00\r\n", 5},
        {good + "\"v\"=hex(123456789):00\r\n", 5},
        {good + "\"v\"=hex 00\r\n", 5},
        {good + "\"v\"=hex:000\r\n", 5},
        {good + "\"v\"=hex:0 0\r\n", 5},
        {good + "\"v\"=hex:,\r\n", 5},
        {good + "\"v\"=hex:00,\\ 01\r\n", 5},
        {good + "\"v\"=hex:00,\\\r\n  01,\\\r\n  x\r\n", 7},
        {good + "\"v\"=hex:00,\\", 5},
        {good + "\r\n\"v\xFF\"=-\r\n", 6},
        {"\xFF\xFEW", 1},
        {std::string("\xFF\xFE\0\0", 4), 1},
    };
    for (const Case &each : cases) {
        CAPTURE(each.text);
        const Outcome refused = import(each.text);
        CHECK(refused.status == 1);
        CHECK(refused.output == "");
        CHECK(refused.errors.find(", line " + std::to_string(each.line) + ": ") != std::string::npos);
        std::vector<WideString> names;
        CHECK(key.values(names) == status::ok);
        CHECK(names.empty());
    }
}

TEST_CASE_FIXTURE(Fixture, "every beginning of a good file is imported or refused, and none does harm") {
    REQUIRE(key.setText(VX_TEXT("t"), VX_TEXT("a\"b\\")) == status::ok);
    REQUIRE(key.setBytes(VX_TEXT("b"), Bytes(30, 3)) == status::ok);
    REQUIRE(key.setU32(VX_TEXT("d"), 5) == status::ok);
    REQUIRE(exportIt().status == 0);
    const std::string whole = bytesOfFile();
    const size_t step = sizeof(wchar_t) == 2 ? 37 : 5;  // a process is dear under Wine
    for (size_t size = 0; size < whole.size(); size += step) {
        const Outcome outcome = import(whole.substr(0, size));
        CHECK((outcome.status == 0 || outcome.status == 1));
        CHECK((outcome.status == 0) == (outcome.errors == ""));
    }
}

TEST_CASE_FIXTURE(Fixture, "export asks before it overwrites, and says what it cannot do") {
    REQUIRE(exportIt().status == 0);
    const std::string first = bytesOfFile();
    REQUIRE(key.setU32(VX_TEXT("new"), 1) == status::ok);
    CHECK(exportIt("n\n").status == 1);
    CHECK(bytesOfFile() == first);
    CHECK(exportIt("y\n").status == 0);
    CHECK(bytesOfFile() != first);
    CHECK(vxreg({"export", shortName + "\\none", file.string(), "/y"}).status == 1);
    CHECK(vxreg({"export", shortName}).status == 1);
    CHECK(vxreg({"export", shortName, (file / "below").string(), "/y"}).status == 1);
    CHECK(vxreg({"import"}).status == 1);
    CHECK(vxreg({"import", file.string() + ".none"}).status == 1);
    CHECK(vxreg({"import", fs::temp_directory_path().string()}).status == 1);
    for (const char *verb : {"export", "import"}) CHECK(vxreg({verb, "/?"}).output.find("Example: vxreg") != std::string::npos);
}
