// Sends standard output and standard error to /dev/null while it lives: the engine's progress lines would mix
// with the measurements. Costs a few microseconds.
#pragma once

#include <cstdio>

#include <fcntl.h>
#include <unistd.h>

class Silence {
  public:
    Silence() : out_(dup(STDOUT_FILENO)), err_(dup(STDERR_FILENO)) {
        static const int nothing = open("/dev/null", O_WRONLY);
        fflush(stdout);
        dup2(nothing, STDOUT_FILENO);
        dup2(nothing, STDERR_FILENO);
    }
    ~Silence() {
        fflush(stdout);
        dup2(out_, STDOUT_FILENO);
        dup2(err_, STDERR_FILENO);
        close(out_);
        close(err_);
    }
    Silence(const Silence&) = delete;
    Silence& operator=(const Silence&) = delete;

  private:
    int out_, err_;
};
