// What the command reads from standard input and what it writes. "-" stands for both streams.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

// Puts bytes into a file, whole or not at all: they go into a new file beside it, which takes its place once
// all of it is written. Devices, pipes and standard output are written to as they are. False, with the reason
// in words, when some of it does not get there.
bool WriteOutput(const std::string& path, const void* data, size_t size, std::string* problem);
bool WriteOutput(const std::string& path, const std::vector<uint8_t>& bytes, std::string* problem);

// What is wrong when an output is the same file as one of the inputs, also by another name or a link: a text
// to go behind the output's name. Empty when it is none of them.
std::string WhyNotOutput(const std::string& output, const std::vector<std::string>& inputs);

// The name of one of several outputs: its number, from 0 on, in place of %d or the like (%04d), else behind
// "-" before the extension, in four digits.
std::string NumberedOutput(const std::string& path, size_t number);

// Ends standard output. False, with the reason, when something of what was printed did not get there.
bool FinishStandardOutput(std::string* problem);

// A file to read. Standard input is copied into a temporary one that goes with this object.
class InputFile {
  public:
    explicit InputFile(const std::string& name);
    ~InputFile();
    InputFile(const InputFile&) = delete;
    InputFile& operator=(const InputFile&) = delete;

    const std::string& Path() const { return path_; }
    // For messages.
    const std::string& Name() const { return name_; }

  private:
    std::string name_, path_;
    bool temporary_ = false;
};

// The name of a new, empty file among the system's temporary ones; empty when there can be none.
std::string NewTemporaryFile();
