// What the process writes to standard output or standard error, and files without a name in any folder.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

// Captures one of the two, C streams and descriptors alike.
class Capture {
  public:
    // STDOUT_FILENO or STDERR_FILENO, from now until Text or the end of the scope.
    explicit Capture(int descriptor)
        : descriptor_(descriptor), stream_(descriptor == STDOUT_FILENO ? stdout : stderr) {
        fflush(stream_);
        setvbuf(stream_, buffer_, _IOFBF, sizeof buffer_);  // not a call to the system for every line
        saved_ = dup(descriptor_);
        dup2(file_, descriptor_);
    }
    ~Capture() {
        Restore();
        close(file_);
    }
    Capture(const Capture&) = delete;
    Capture& operator=(const Capture&) = delete;

    // Ends the capture and returns what was written.
    std::string Text() {
        Restore();
        std::string text(static_cast<size_t>(lseek(file_, 0, SEEK_END)), '\0');
        if (pread(file_, text.data(), text.size(), 0) != static_cast<ssize_t>(text.size())) text = "lost";
        return text;
    }

  private:
    void Restore() {
        if (saved_ < 0) return;
        fflush(stream_);
        setvbuf(stream_, nullptr, _IONBF, 0);  // the only mode that lets go of the buffer
        dup2(saved_, descriptor_);
        close(saved_);
        saved_ = -1;
    }

    int descriptor_;
    FILE* stream_;
    int file_ = memfd_create("capture", 0);
    int saved_ = -1;
    char buffer_[4096];
};

// Both streams at once.
class BothOutputs {
  public:
    std::string Out() { return out_.Text(); }
    std::string Errors() { return errors_.Text(); }

  private:
    Capture out_{STDOUT_FILENO}, errors_{STDERR_FILENO};
};

// A file that lives as long as the object.
class MemoryFile {
  public:
    explicit MemoryFile(const std::vector<uint8_t>& bytes) {
        if (write(descriptor_, bytes.data(), bytes.size()) != static_cast<ssize_t>(bytes.size())) abort();
    }
    ~MemoryFile() { close(descriptor_); }
    const char* Path() const { return path_.c_str(); }

  private:
    int descriptor_ = memfd_create("file", 0);
    std::string path_ = "/proc/self/fd/" + std::to_string(descriptor_);
};
