// SPDX-License-Identifier: MIT
#include "tools/vxreg/command.h"

namespace vxreg {

std::string usage(const std::string &verb) {
    if (verb.empty()) {
        return "vxreg VERB KEY [OPTION...]: reads and writes the machine's registry.\n"
               "\n"
               "  vxreg query    prints values and keys\n"
               "  vxreg add      makes a key, writes a value\n"
               "  vxreg delete   deletes a key or values\n"
               "  vxreg export   writes a key with all below it into a file\n"
               "  vxreg import   writes into the registry what such a file holds\n"
               "\n"
               "A key is HKLM, HKCU, HKU or HKCR (or HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER, HKEY_USERS, HKEY_CLASSES_ROOT) and a\n"
               "path below it: HKLM\\Software\\Name. On Linux the registry is in the folder that VXCOMN_ROOT names.\n"
               "\n"
               "The exit status is 0, or 1 with a message. 'vxreg VERB /?' tells about a verb.\n";
    }
    if (verb == "query") {
        return "vxreg query KEY [/v NAME | /ve] [/s] [/t TYPE]\n"
               "\n"
               "  /v NAME   the value of that name only\n"
               "  /ve       the key's own value only, which has no name\n"
               "  /s        the keys below too, all the way down\n"
               "  /t TYPE   values of that type only: REG_SZ, REG_EXPAND_SZ, REG_MULTI_SZ, REG_BINARY, REG_DWORD, REG_QWORD, "
               "REG_NONE\n"
               "\n"
               "Example: vxreg query HKLM\\Software\\Name /v Level\n";
    }
    if (verb == "add") {
        return "vxreg add KEY [/v NAME | /ve] [/t TYPE] [/s TEXT] [/d DATA] [/f]\n"
               "\n"
               "  /v NAME   the name of the value; without it and without /d the key alone is made\n"
               "  /ve       the key's own value, which has no name\n"
               "  /t TYPE   REG_SZ (the default), REG_EXPAND_SZ, REG_MULTI_SZ, REG_BINARY, REG_DWORD, REG_QWORD, REG_NONE\n"
               "  /s TEXT   what stands between the strings of a REG_MULTI_SZ; \\0 without it\n"
               "  /d DATA   text; a number, decimal or 0x; or bytes, hexadecimal\n"
               "  /f        overwrites without asking\n"
               "\n"
               "Example: vxreg add HKLM\\Software\\Name /v Level /t REG_DWORD /d 0x10 /f\n";
    }
    if (verb == "delete") {
        return "vxreg delete KEY [/v NAME | /ve | /va] [/f]\n"
               "\n"
               "  /v NAME   the value of that name only\n"
               "  /ve       the key's own value only, which has no name\n"
               "  /va       all values of the key, but no key\n"
               "  /f        deletes without asking\n"
               "\n"
               "Without /v, /ve or /va the key itself is deleted, with all below it.\n"
               "\n"
               "Example: vxreg delete HKLM\\Software\\Name /f\n";
    }
    if (verb == "export") {
        return "vxreg export KEY FILE [/y]\n"
               "\n"
               "  /y   overwrites the file without asking\n"
               "\n"
               "The file is text, as Windows' own tools write it (.reg), in UTF-16.\n"
               "\n"
               "Example: vxreg export HKLM\\Software\\Name saved.reg\n";
    }
    if (verb == "import") {
        return "vxreg import FILE\n"
               "\n"
               "The file is text as 'vxreg export' writes it, in UTF-16 or UTF-8. If there is a mistake in it nothing is written, "
               "and the\n"
               "message names its line.\n"
               "\n"
               "Example: vxreg import saved.reg\n";
    }
    return {};
}

}  // namespace vxreg
