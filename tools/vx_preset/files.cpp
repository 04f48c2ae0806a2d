// SPDX-License-Identifier: MIT
#include "tools/vx_preset/files.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>

#include "tools/vx_preset/failure.h"

namespace vx::preset {
namespace {

namespace fs = std::filesystem;

constexpr size_t kPieceBytes = 1 << 16;

Bytes readAll(std::istream &in, const std::string &path) {
    Bytes bytes;
    char piece[kPieceBytes];
    while (in.read(piece, sizeof piece) || in.gcount() > 0) {
        bytes.insert(bytes.end(), piece, piece + in.gcount());
        if (bytes.size() > kLargestInputBytes) {
            throw Failure(Exit::input, path + ": found more than " + std::to_string(kLargestInputBytes >> 20) +
                                           " MiB, expected a preset, a package or their JSON; is this the right file?");
        }
    }
    return bytes;
}

}  // namespace

Bytes readInput(const std::string &path) {
    if (path == "-") return readAll(std::cin, "standard input");
    std::error_code ignored;
    if (fs::is_directory(path, ignored)) throw Failure(Exit::input, path + ": found a folder, expected a file");
    std::ifstream in(path, std::ios::binary);
    if (!in) throw Failure(Exit::input, path + ": cannot be opened (" + std::strerror(errno) + "); check the path and its rights");
    return readAll(in, path);
}

void writeOutput(const std::string &path, std::span<const uint8_t> bytes, bool force) {
    if (path == "-") {
        std::cout.write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
        if (!std::cout.flush())
            throw Failure(Exit::system, "standard output: cannot be written; is the reader gone or the disk full?");
        return;
    }
    std::error_code error;
    if (!force && fs::exists(path, error)) {
        throw Failure(Exit::usage, path + ": exists already; choose another name, or say --force to write over it");
    }
    // A new file beside it takes its place at the end, so that a failure leaves the old one whole.
    const std::string fresh = path + ".new";
    std::ofstream out(fresh, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    out.close();
    if (out) fs::rename(fresh, path, error);
    if (!out || error) {
        const std::string why = error ? error.message() : std::strerror(errno);
        fs::remove(fresh, error);
        throw Failure(Exit::system, path + ": cannot be written (" + why + "); check the folder, its rights and the space left");
    }
}

void writeOutput(const std::string &path, const std::string &text, bool force) {
    writeOutput(path, {reinterpret_cast<const uint8_t *>(text.data()), text.size()}, force);
}

}  // namespace vx::preset
