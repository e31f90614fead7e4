// This very program once more, as a process of its own: what it does cannot hurt the window.
#pragma once

#include <string>
#include <vector>

#include <sys/types.h>

// Starts "qex" with these words; its messages go to an open file. -1, with errno, when it cannot.
pid_t StartQex(const std::vector<std::string>& words, int messages);

// The same to its end. Returns its last line when it fails, or nothing.
std::string RunQex(const std::vector<std::string>& words);
