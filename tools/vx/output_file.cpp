// SPDX-License-Identifier: MIT
#include "tools/vx/output_file.h"

#include <cerrno>
#include <cstring>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx {
namespace fs = std::filesystem;

namespace {

bool isSpecial(const fs::path &path) {
    std::error_code ignored;
    const fs::file_status status = fs::status(path, ignored);
    return fs::exists(status) && !fs::is_regular_file(status) && !fs::is_directory(status);
}

std::string adviceFor(int error) {
    if (error == ENOSPC || error == EFBIG) return "; make room or choose another folder";
    if (error == EACCES || error == EROFS || error == EPERM) return "; choose a folder that you may write to";
    if (error == ENOENT || error == ENOTDIR) return "; create the folder first";
    return "";
}

}  // namespace

void checkMayWrite(const std::string &path, bool force) {
    std::error_code ignored;
    if (fs::is_directory(pathOf(path), ignored)) throw Failure(ExitStatus::usage, path + ": is a folder; name a file");
    if (!force && !isSpecial(pathOf(path)) && fs::exists(pathOf(path), ignored))
        throw Failure(ExitStatus::usage, path + ": exists already; nothing was written. Name another file or give --force");
}

OutputFile::OutputFile(const std::string &path, bool force)
    : path_(path), target_(pathOf(path)), writePath_(target_), force_(force) {
    if (path == "-") {
        stream_ = binaryOutput();
        return;
    }
    checkMayWrite(path, force);
    if (!isSpecial(target_)) {
        temporary_ = true;
        writePath_ += ".part-" + std::to_string(processId());
    }
    owned_ = openFile(writePath_, "wb");
    stream_ = owned_.get();
    if (stream_ == nullptr) {
        temporary_ = false;
        fail(errno);
    }
}

OutputFile::~OutputFile() {
    owned_.reset();
    std::error_code ignored;
    if (temporary_) fs::remove(writePath_, ignored);
}

void OutputFile::fail(int error) const {
    throw Failure(ExitStatus::system, path_ + ": cannot be written: " + std::strerror(error) + adviceFor(error));
}

void OutputFile::write(const void *bytes, size_t count) {
    errno = 0;
    if (count == 0) return;  // of no bytes even the address may be missing
    if (std::fwrite(bytes, 1, count, stream_) != count) fail(errno);
}

void OutputFile::seek(uint64_t position) {
    errno = 0;
    if (!seekFile(stream_, position)) fail(errno);
}

void OutputFile::closeStream() {
    errno = 0;
    if (stream_ == nullptr) return;
    if (std::fflush(stream_) != 0) fail(errno);
    std::FILE *closing = owned_.release();
    stream_ = nullptr;
    if (closing != nullptr && std::fclose(closing) != 0) fail(errno);
}

void OutputFile::commit() {
    closeStream();
    if (!temporary_) return;
    checkMayWrite(path_, force_);
    std::error_code error;
    fs::rename(writePath_, target_, error);
    if (error) throw Failure(ExitStatus::system, path_ + ": cannot be named so: " + error.message());
    temporary_ = false;
}

}  // namespace vx
