// Importers of many formats are as sound as the files that they were tried on: what they do with others stays
// in a process of its own.
#pragma once

#include <functional>
#include <string>

// Runs `work` in a child process that may take so many megabytes of memory, and returns its exit status.
// Lines on standard error that begin with "qex convert: " are passed on as they come, all others are the
// importer's and are held back. When the child crashes, or runs out of memory, one line says so, and the
// status is 1.
int RunInProcess(const std::string& file, int megabytes, const std::function<int()>& work);
