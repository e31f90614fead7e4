// Files are written beside their place and renamed; streams are written as they are.
#include "common/OutputFile.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

constexpr int kTries = 100;  // names of a temporary file

bool WriteAll(int file, const void* data, size_t size) {
    const char* bytes = static_cast<const char*>(data);
    while (size > 0) {
        const ssize_t written = write(file, bytes, size);
        if (written < 0 && errno == EINTR) continue;
        if (written < 0) return false;
        bytes += written;
        size -= static_cast<size_t>(written);
    }
    return true;
}

// Also false where the disk is found to be full only at the end.
bool WriteAndClose(int file, const void* data, size_t size) {
    const bool written = WriteAll(file, data, size);
    const int reason = errno;
    if (close(file) == 0 && written) return true;
    if (!written) errno = reason;
    return false;
}

bool WriteInPlace(const std::string& path, const void* data, size_t size) {
    const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    return file >= 0 && WriteAndClose(file, data, size);
}

int OpenNewFile(const fs::path& folder, std::string* path) {
    for (int i = 0; i < kTries; ++i) {
        *path = (folder / (".qex-" + std::to_string(getpid()) + "-" + std::to_string(i))).string();
        const int file = open(path->c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (file >= 0 || errno != EEXIST) return file;
    }
    return -1;
}

bool WriteAndRename(const std::string& path, const void* data, size_t size) {
    std::error_code error;
    // A link stays one: the file that it leads to is what is replaced, or made where there is none.
    const bool link = fs::is_symlink(path, error);
    if (link && !fs::exists(path, error)) return WriteInPlace(path, data, size);
    const fs::path target = link ? fs::canonical(path, error) : fs::path(path);
    struct stat old = {};
    const bool replaces = stat(target.c_str(), &old) == 0;
    // A rename would go past the file's own protection.
    if (replaces && access(target.c_str(), W_OK) != 0) return false;
    std::string temporary;
    const int file = OpenNewFile(target.parent_path(), &temporary);
    // In a folder that takes no new files an old one may still be written to.
    if (file < 0) return replaces && WriteInPlace(path, data, size);
    if (replaces && fchmod(file, old.st_mode & 07777) != 0) errno = 0;
    if (WriteAndClose(file, data, size) && rename(temporary.c_str(), target.c_str()) == 0) return true;
    const int reason = errno;
    unlink(temporary.c_str());
    errno = reason;
    return false;
}

bool IsStream(const std::string& path) {
    struct stat status = {};
    return stat(path.c_str(), &status) == 0 && !S_ISREG(status.st_mode);
}

}  // namespace

bool WriteOutput(const std::string& path, const void* data, size_t size, std::string* problem) {
    errno = 0;
    bool written;
    if (path == "-")
        written = WriteAll(STDOUT_FILENO, data, size);
    else
        written = IsStream(path) ? WriteInPlace(path, data, size) : WriteAndRename(path, data, size);
    if (!written) *problem = std::string("cannot be written: ") + strerror(errno);
    return written;
}

bool WriteOutput(const std::string& path, const std::vector<uint8_t>& bytes, std::string* problem) {
    return WriteOutput(path, bytes.data(), bytes.size(), problem);
}

std::string WhyNotOutput(const std::string& output, const std::vector<std::string>& inputs) {
    if (output == "-") return "";  // no file of that name
    for (const std::string& input : inputs) {
        std::error_code error;
        if (input.empty() || !fs::equivalent(input, output, error) || error || IsStream(output)) continue;
        return "is the input" + (input == output ? "" : " " + input) + "; another name is expected";
    }
    return "";
}

std::string NumberedOutput(const std::string& path, size_t number) {
    std::string digits = std::to_string(number);
    const auto pad = [&digits](size_t width) {
        digits.insert(0, width > digits.size() ? width - digits.size() : 0, '0');
    };
    for (size_t at = path.find('%'); at != std::string::npos; at = path.find('%', at + 1)) {
        const size_t end = path.find_first_not_of("0123456789", at + 1);
        if (end == std::string::npos || path[end] != 'd' || end > at + 3) continue;
        // Spaces, which a width without a 0 asks for, have no place in a name.
        if (end > at + 1) pad(std::stoul(path.substr(at + 1, end - at - 1)));
        return path.substr(0, at) + digits + path.substr(end + 1);
    }
    pad(4);
    const fs::path name = path;
    return (name.parent_path() / name.stem()).string() + "-" + digits + name.extension().string();
}

bool FinishStandardOutput(std::string* problem) {
    errno = 0;
    const bool written = fflush(stdout) == 0 && !ferror(stdout);
    const int reason = errno;
    // Closed from the start, it does not matter as long as nothing is printed.
    if ((fclose(stdout) == 0 || errno == EBADF) && written) return true;
    *problem = "standard output cannot be written";
    if (reason || errno) *problem += std::string(": ") + strerror(reason ? reason : errno);
    return false;
}

InputFile::InputFile(const std::string& name) : name_(name), path_(name) {
    if (name != "-") return;
    name_ = "standard input";
    path_ = NewTemporaryFile();
    temporary_ = !path_.empty();
    FILE* copy = fopen(path_.c_str(), "wb");
    if (!copy) return;
    char chunk[65536];
    for (size_t got; (got = fread(chunk, 1, sizeof chunk, stdin)) > 0;) fwrite(chunk, 1, got, copy);
    // What is cut short is no input.
    const bool whole = !ferror(stdin) && !ferror(copy);
    if (fclose(copy) != 0 || !whole) unlink(path_.c_str());
}

InputFile::~InputFile() {
    if (temporary_) unlink(path_.c_str());
}

std::string NewTemporaryFile() {
    std::error_code error;
    std::string path = (fs::temp_directory_path(error) / "qex-XXXXXX").string();
    const int file = mkstemp(path.data());
    if (file < 0) return "";
    close(file);
    return path;
}
