// Processes of "qex".
#include "desktop/Child.h"

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>

extern char** environ;

pid_t StartQex(const std::vector<std::string>& words, int messages) {
    std::vector<char*> arguments = {const_cast<char*>("qex")};
    for (const std::string& word : words) arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_adddup2(&files, messages, STDERR_FILENO);
    pid_t child = -1;
    const int error = posix_spawn(&child, "/proc/self/exe", &files, nullptr, arguments.data(), environ);
    posix_spawn_file_actions_destroy(&files);
    errno = error;
    return error == 0 ? child : -1;
}

std::string RunQex(const std::vector<std::string>& words) {
    FILE* messages = tmpfile();
    if (!messages) return std::string("no temporary file: ") + strerror(errno);
    std::string problem;
    int status = 0;
    const pid_t child = StartQex(words, fileno(messages));
    if (child < 0) {
        problem = std::string("no process can be started for it: ") + strerror(errno);
    } else {
        while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
        }
        const bool well = WIFEXITED(status) && WEXITSTATUS(status) == 0;
        if (!well) problem = "it cannot be drawn";
        char line[1024];
        rewind(messages);
        while (!well && fgets(line, sizeof line, messages))
            problem = std::string(line).substr(0, strcspn(line, "\n"));
    }
    fclose(messages);
    return problem;
}
