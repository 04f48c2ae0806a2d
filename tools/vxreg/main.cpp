// SPDX-License-Identifier: MIT
//
// The program vxreg: picks the verb and turns its failure into a message and exit status 1.
#include <algorithm>
#include <cctype>
#include <exception>
#include <iostream>
#include <utility>

#include "tools/common/arguments.h"
#include "tools/vxreg/command.h"

namespace {

bool asksForHelp(const std::string &argument) {
    return argument == "/?" || argument == "-?" || argument == "-h" || argument == "--help";
}

std::string verbOf(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return text;
}

void run(std::vector<std::string> arguments) {
    if (arguments.empty()) vxreg::failSyntax("", "a verb is missing");
    if (asksForHelp(arguments.front())) {
        std::cout << vxreg::usage("");
        return;
    }
    const std::string verb = verbOf(arguments.front());
    const std::string help = vxreg::usage(verb);
    if (help.empty()) vxreg::failSyntax("", "unknown verb '" + arguments.front() + "'");
    arguments.erase(arguments.begin());
    if (!arguments.empty() && asksForHelp(arguments.front())) {
        std::cout << help;
    } else if (verb == "add") {
        vxreg::add(arguments);
    } else if (verb == "query") {
        vxreg::query(arguments);
    } else if (verb == "export") {
        vxreg::exportKeys(std::move(arguments));
    } else if (verb == "import") {
        vxreg::importKeys(arguments);
    } else {
        vxreg::remove(arguments);
    }
}

}  // namespace

int main(int argc, char **argv) {
    try {
        run(vxcomn::utf8Arguments(argc, argv));
    } catch (const vxreg::Failure &failure) {
        std::cout.flush();
        std::cerr << failure.message << "\n";
        return 1;
    } catch (const std::exception &error) {
        std::cerr << "ERROR: " << error.what() << "\n";
        return 1;
    }
    std::cout.flush();
    if (std::cout) return 0;
    std::cerr << "ERROR: The standard output can't be written\n";
    return 1;
}
