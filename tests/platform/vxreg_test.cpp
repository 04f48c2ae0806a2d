// SPDX-License-Identifier: MIT
//
// The program vxreg, run as a script runs it: what it prints, what it does, and its exit status.
#include <doctest/doctest.h>

#include "tests/platform/registry_fixture.h"

using namespace vxcomn;
using test::Outcome;

namespace {

struct VxregFixture : test::RegistryFixture {
    std::string shortName = "HKCU\\" + toUtf8(path);
    std::string longName = "HKEY_CURRENT_USER\\" + toUtf8(path);

    static Outcome vxreg(const std::vector<std::string> &arguments, const std::string &input = {}) {
        return test::run(test::builtProgram("vxreg"), arguments, input);
    }
    // Runs it on the fixture's key.
    Outcome on(const std::string &verb, std::vector<std::string> rest, const std::string &input = {},
               const std::string &sub = {}) const {
        rest.insert(rest.begin(), {verb, shortName + sub});
        return vxreg(rest, input);
    }
    std::string row(const std::string &text) const { return "\n" + longName + "\n    " + text + "\n\n"; }
};

const std::string kDone = "The operation completed successfully.\n";

}  // namespace

TEST_CASE_FIXTURE(VxregFixture, "vxreg add and query speak every type") {
    struct Case {
        const char *type, *data, *printed;
    };
    for (const Case &c :
         {Case{"REG_SZ", "some text", "REG_SZ    some text"}, Case{"REG_EXPAND_SZ", "%a%\\b", "REG_EXPAND_SZ    %a%\\b"},
          Case{"REG_MULTI_SZ", "one\\0two", "REG_MULTI_SZ    one\\0two"}, Case{"REG_BINARY", "00ff1E", "REG_BINARY    00FF1E"},
          Case{"REG_BINARY", "abc", "REG_BINARY    0ABC"}, Case{"REG_DWORD", "31", "REG_DWORD    0x1f"},
          Case{"REG_DWORD", "0xFFFFFFFF", "REG_DWORD    0xffffffff"},
          Case{"REG_QWORD", "0x123456789A", "REG_QWORD    0x123456789a"}, Case{"reg_qword", "10", "REG_QWORD    0xa"},
          Case{"REG_NONE", "01", "REG_NONE    01"}, Case{"REG_SZ", "", "REG_SZ    "}}) {
        CAPTURE(c.type);
        const Outcome added = on("add", {"/v", "Name", "/t", c.type, "/d", c.data, "/f"});
        CHECK(added.output == kDone);
        CHECK(added.errors == "");
        CHECK(added.status == 0);
        const Outcome queried = on("query", {"/v", "name"});
        CHECK(queried.output == row(std::string("name    ") + c.printed));
        CHECK(queried.status == 0);
    }
}

TEST_CASE_FIXTURE(VxregFixture, "what vxreg adds is what the library reads") {
    CHECK(on("add", {"/v", "t", "/d", "gr\xC3\xBC\xC3\x9F", "/f"}).status == 0);
    CHECK(on("add", {"/v", "m", "/t", "REG_MULTI_SZ", "/s", ";", "/d", "a;b", "/f"}).status == 0);
    CHECK(on("add", {"/v", "d", "/t", "REG_DWORD", "/d", "7", "/f"}).status == 0);
    CHECK(on("add", {"/d", "own", "/f"}).status == 0);
    WideString text;
    RegistryValue value;
    uint32_t number = 0;
    CHECK(key.readText(VX_TEXT("t"), text) == RegistryRead::value);
    CHECK(text == VX_TEXT("gr\u00FC\u00DF"));
    CHECK(key.query(VX_TEXT("m"), value) == status::ok);
    CHECK(value.type == RegistryType::multiSz);
    CHECK(value.data == std::vector<uint8_t>{'a', 0, 0, 0, 'b', 0, 0, 0, 0, 0});
    CHECK(key.readU32(VX_TEXT("d"), number) == RegistryRead::value);
    CHECK(number == 7);
    CHECK(key.readText({}, text) == RegistryRead::value);
    CHECK(text == VX_TEXT("own"));
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg query prints values, and the names of the keys below") {
    RegistryKey below;
    key.setU32(VX_TEXT("n"), 5);
    key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, below);
    below.setText({}, VX_TEXT("deep"));
    const Outcome plain = on("query", {});
    CHECK(plain.output == "\n" + longName + "\n    n    REG_DWORD    0x5\n\n" + longName + "\\A\n");
    CHECK(plain.status == 0);
    const Outcome all = on("query", {"/s"});
    CHECK(all.output == "\n" + longName + "\n    n    REG_DWORD    0x5\n\n" + longName + "\\A\n\n" + longName +
                            "\\A\\B\n    (Default)    REG_SZ    deep\n\n");
    CHECK(on("query", {}, {}, "\\A\\b").output == "\n" + longName + "\\A\\b\n    (Default)    REG_SZ    deep\n\n");
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg query searches by type, and by name all the way down") {
    RegistryKey below;
    key.setU32(VX_TEXT("n"), 5);
    key.setText(VX_TEXT("t"), VX_TEXT("x"));
    key.createBelow(VX_TEXT("A"), RegistryAccess::readWrite, below);
    below.setText(VX_TEXT("t"), VX_TEXT("y"));
    CHECK(on("query", {"/t", "REG_SZ"}).output ==
          "\n" + longName + "\n    t    REG_SZ    x\n\nEnd of search: 1 match(es) found.\n");
    CHECK(on("query", {"/s", "/v", "T"}).output == "\n" + longName + "\n    t    REG_SZ    x\n\n" + longName +
                                                       "\\A\n    t    REG_SZ    y\n\nEnd of search: 2 match(es) found.\n");
    const Outcome none = on("query", {"/t", "REG_QWORD"});
    CHECK(none.output == "\nEnd of search: 0 match(es) found.\n");
    CHECK(none.errors.starts_with("ERROR: "));
    CHECK(none.status == 1);
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg query tells that the key's own value is not set") {
    const Outcome unset = on("query", {"/ve"});
    CHECK(unset.output == row("(Default)    REG_SZ    (value not set)"));
    CHECK(unset.status == 0);
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg add asks before it overwrites, and the end of the input means no") {
    key.setU32(VX_TEXT("n"), 1);
    uint32_t number = 0;
    const auto level = [&] { return key.readU32(VX_TEXT("n"), number) == RegistryRead::value ? number : 99; };
    const Outcome declined = on("add", {"/v", "n", "/t", "REG_DWORD", "/d", "2"});
    CHECK(declined.output == "Value n exists, overwrite (Yes/No)? \n");
    CHECK(declined.errors == "The operation was canceled by the user.\n");
    CHECK(declined.status == 1);
    CHECK(on("add", {"/v", "n", "/t", "REG_DWORD", "/d", "2"}, "no\n").status == 1);
    CHECK(level() == 1);
    CHECK(on("add", {"/v", "n", "/t", "REG_DWORD", "/d", "2"}, "y\n").status == 0);
    CHECK(level() == 2);
    CHECK(on("add", {"/v", "n", "/t", "REG_DWORD", "/d", "3"}, "Yes\r\n").status == 0);
    CHECK(level() == 3);
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg delete takes a value, all values, or the key with all below it") {
    RegistryKey below;
    std::vector<WideString> names;
    key.setU32(VX_TEXT("a"), 1);
    key.setU32(VX_TEXT("b"), 1);
    key.setU32({}, 1);
    key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, below);
    below.close();
    CHECK(on("delete", {"/v", "a"}).status == 1);  // nobody says yes
    CHECK(on("delete", {"/v", "a"}, "y\n").output == "Delete the registry value a (Yes/No)? \n" + kDone);
    CHECK(on("delete", {"/ve", "/f"}).output == kDone);
    key.values(names);
    CHECK(names == std::vector<WideString>{VX_TEXT("b")});
    CHECK(on("delete", {"/va"}, "yes\n").output ==
          "Permanently delete all values under the registry key " + longName + " (Yes/No)? \n" + kDone);
    key.values(names);
    CHECK(names.empty());
    CHECK(on("delete", {}, "n\n", "\\A").status == 1);
    CHECK(on("delete", {}, "y\n", "\\A").output == "Permanently delete the registry key " + longName + "\\A (Yes/No)? \n" + kDone);
    key.subkeys(names);
    CHECK(names.empty());
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg answers 1 and says why for what is not there") {
    for (const Outcome &outcome : {on("query", {}, {}, "\\Missing"), on("query", {"/v", "missing"}),
                                   on("delete", {"/f"}, {}, "\\Missing"), on("delete", {"/v", "missing", "/f"})}) {
        CHECK(outcome.status == 1);
        CHECK(outcome.output == "");
        CHECK(outcome.errors.starts_with("ERROR: The system was unable to find the specified registry key or value: " + longName));
    }
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg declines a line that it does not understand and changes nothing") {
    const std::vector<std::vector<std::string>> lines = {
        {},
        {"frobnicate", shortName},
        {"add"},
        {"add", "HKXX\\Software"},
        {"add", "Software\\X"},
        {"add", shortName + "\\\\X"},
        {"add", shortName, "/x"},
        {"add", shortName, "/v"},
        {"add", shortName, "/v", "a", "/v", "b"},
        {"add", shortName, "/v", "a", "/ve"},
        {"add", shortName, "/v", "a", "/t", "REG_WORD"},
        {"add", shortName, "/v", "a", "/t", "REG_DWORD", "/d", "0x100000000"},
        {"add", shortName, "/v", "a", "/t", "REG_DWORD", "/d", "-1"},
        {"add", shortName, "/v", "a", "/t", "REG_DWORD", "/d", "12x"},
        {"add", shortName, "/v", "a", "/t", "REG_DWORD", "/d", "0x"},
        {"add", shortName, "/v", "a", "/t", "REG_BINARY", "/d", "0g"},
        {"add", shortName, "/v", "a", "/t", "REG_MULTI_SZ", "/d", "a\\0\\0b"},
        {"query", shortName, "/f"},
        {"query", shortName, "/t", "REG_WORD"},
        {"delete", shortName, "/va", "/v", "a"},
        {"delete", "HKCU", "/f"},
    };
    for (const auto &line : lines) {
        CAPTURE(line.size());
        const Outcome outcome = vxreg(line);
        CHECK(outcome.status == 1);
        CHECK(outcome.output == "");
        CHECK(outcome.errors.starts_with("ERROR: "));
    }
    std::vector<WideString> names;
    CHECK(key.values(names) == status::ok);
    CHECK(names.empty());
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg tells about itself and each verb") {
    const std::vector<std::vector<std::string>> lines = {{"/?"}, {"--help"}, {"add", "/?"}, {"query", "--help"}, {"delete", "-h"}};
    for (const auto &line : lines) {
        const Outcome outcome = vxreg(line);
        CHECK(outcome.status == 0);
        CHECK(outcome.errors == "");
        CHECK(outcome.output.find(line.size() > 1 ? "vxreg " + line[0] + " KEY" : "vxreg VERB KEY") == 0);
    }
}

TEST_CASE_FIXTURE(VxregFixture, "vxreg knows the roots by both names, in any case") {
    for (const std::string root :
         {"HKLM", "hkey_local_machine", "HKCU", "HKEY_CURRENT_USER", "HKU", "HKEY_USERS", "HKCR", "Hkey_Classes_Root"}) {
        CAPTURE(root);
        const Outcome outcome = vxreg({"query", root, "/ve"});
        CHECK(outcome.status == 0);
        CHECK(outcome.output.starts_with("\nHKEY_"));
    }
}
