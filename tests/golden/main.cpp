// SPDX-License-Identifier: MIT
//
// golden: runs every scene and compares the digests with a list, or writes the list.
//
//     golden                   prints name and digest of each scene
//     golden --write FILE      writes them to a file
//     golden --check FILE      compares with a file; exit status 1 if any differs, is missing or is unknown
//
// The digests are the same for every compiler, optimisation, platform and instruction set (VXCOMN_ISA=sse2, avx2, avx512).
#include <cstdio>
#include <exception>
#include <fstream>
#include <iostream>
#include <map>
#include <string>

#include "scene.h"

namespace {

std::string hexadecimal(uint64_t value) {
    char text[17];
    std::snprintf(text, sizeof text, "%016llx", static_cast<unsigned long long>(value));
    return text;
}

int write(std::ostream &out) {
    for (const golden::Scene &scene : golden::allScenes()) out << hexadecimal(golden::digestOf(scene)) << ' ' << scene.name << '\n';
    out.flush();
    return out.good() ? 0 : 1;
}

int check(const char *path) {
    std::ifstream in(path);
    std::map<std::string, std::string> wanted;
    for (std::string line; std::getline(in, line);) {
        while (!line.empty() && line.back() == '\r') line.pop_back();
        if (line.size() > 17) wanted[line.substr(17)] = line.substr(0, 16);
    }
    int checked = 0;
    int failed = 0;
    for (const golden::Scene &scene : golden::allScenes()) {
        const std::string found = hexadecimal(golden::digestOf(scene));
        ++checked;
        const auto entry = wanted.find(scene.name);
        if (entry == wanted.end()) {
            std::printf("%s: digest %s, and the list has none\n", scene.name.c_str(), found.c_str());
            ++failed;
            continue;
        }
        if (entry->second != found) {
            std::printf("%s: digest %s instead of %s\n", scene.name.c_str(), found.c_str(), entry->second.c_str());
            ++failed;
        }
        wanted.erase(entry);
    }
    for (const auto &[name, digest] : wanted) std::printf("%s: no such scene, or twice\n", name.c_str());
    failed += static_cast<int>(wanted.size());
    std::printf("golden: %d scenes, %d differ\n", checked, failed);
    return failed == 0 && checked != 0 ? 0 : 1;
}

int run(int argc, char **argv) {
    const std::string option = argc > 1 ? argv[1] : "";
    if (argc == 3 && option == "--check") return check(argv[2]);
    if (argc == 3 && option == "--write") {
        std::ofstream file(argv[2], std::ios::binary);
        return write(file);
    }
    if (argc == 1) return write(std::cout);
    std::fputs("usage: golden [--write FILE | --check FILE]\n", stderr);
    return 2;
}

}  // namespace

int main(int argc, char **argv) {
    try {
        return run(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "golden: %s\n", error.what());
        return 1;
    }
}
