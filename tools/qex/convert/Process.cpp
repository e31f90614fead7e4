// The child writes its messages into a pipe that the parent reads line by line.
#include "convert/Process.h"

#ifdef __linux__
#include <sys/prctl.h>
#endif
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstring>

#include "common/CommandLine.h"
#include "common/OutputFile.h"
#include "convert/Log.h"

namespace {

constexpr char kOurs[] = "qex convert: ";

// The sanitizer's own memory does not fit under a limit, and its reports are for whoever reads the tests.
#ifdef __SANITIZE_ADDRESS__
constexpr bool kSanitized = true;
#else
constexpr bool kSanitized = false;
#endif

void Limit(int what, uint64_t bytes) {
    // rlim_t may have 32 bits.
    const rlim_t most = bytes < RLIM_INFINITY ? static_cast<rlim_t>(bytes) : RLIM_INFINITY;
    const rlimit limit = {most, most};
    setrlimit(static_cast<decltype(RLIMIT_AS)>(what), &limit);
}

[[noreturn]] void RunChild(int errors, pid_t parent, int megabytes, const std::function<int()>& work) {
    // Importers and the C++ runtime write to standard error themselves, whatever log they are given.
    dup2(errors, STDERR_FILENO);
    close(errors);
#ifdef __linux__
    prctl(PR_SET_PDEATHSIG, SIGKILL);  // it shall not outlive a command that is stopped
    if (getppid() != parent) _exit(kBadInput);
#endif
    Limit(RLIMIT_CORE, 0);
    if (!kSanitized) Limit(RLIMIT_AS, static_cast<uint64_t>(megabytes) << 20);
    int status = work();
    std::string problem;
    if (!FinishStandardOutput(&problem)) {
        fprintf(stderr, "%s%s\n", kOurs, problem.c_str());
        status = status ? status : kBadArgument;
    }
    fflush(stderr);
    _exit(status);
}

// What the child says on standard error, line by line.
class Messages {
  public:
    void Read(int from) {
        char chunk[4096];
        for (;;) {
            const ssize_t got = read(from, chunk, sizeof chunk);
            if (got < 0 && errno == EINTR) continue;
            if (got <= 0) break;
            text_.append(chunk, static_cast<size_t>(got));
            for (size_t end; (end = text_.find('\n')) != std::string::npos; text_.erase(0, end + 1))
                Take(text_.substr(0, end));
        }
        if (!text_.empty()) Take(text_);
    }
    bool AnyError() const { return error_; }
    // The last thing that a library has said.
    const std::string& Reason() const { return reason_; }

  private:
    void Take(const std::string& line) {
        const bool ours = line.compare(0, strlen(kOurs), kOurs) == 0;
        if (ours || kSanitized || GetTalk().verbose) fprintf(stderr, "%s\n", line.c_str());
        error_ |= ours && line.find(": warning: ") == std::string::npos;
        if (!ours && !line.empty()) reason_ = line;
    }

    std::string text_, reason_;
    bool error_ = false;
};

std::string WhyItEnded(int status, const Messages& messages, int megabytes) {
    const std::string& reason = messages.Reason();
    if (reason.find("bad_alloc") != std::string::npos || reason.find("out of memory") != std::string::npos)
        return NeedsMoreMemory(megabytes);
    std::string text = "cannot be converted: ";
    if (WIFSIGNALED(status))
        text += std::string("the importer crashed, ") + strsignal(WTERMSIG(status));
    else
        text += "the importer ended the process with status " + std::to_string(WEXITSTATUS(status));
    return text + (reason.empty() ? "" : " (" + reason + ")");
}

}  // namespace

int RunInProcess(const std::string& file, int megabytes, const std::function<int()>& work) {
    int ends[2];
    fflush(nullptr);  // else what waits there is written twice
    const bool piped = pipe(ends) == 0;
    const pid_t parent = getpid(), child = piped ? fork() : -1;
    if (child < 0) {
        ConvertLog(file).Error(std::string("no process can be started for it: ") + strerror(errno));
        return kBadInput;
    }
    if (child == 0) {
        close(ends[0]);
        RunChild(ends[1], parent, megabytes, work);
    }
    close(ends[1]);
    Messages messages;
    messages.Read(ends[0]);
    close(ends[0]);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (WIFEXITED(status) && (WEXITSTATUS(status) == kDone || messages.AnyError()))
        return WEXITSTATUS(status);
    ConvertLog(file).Error(WhyItEnded(status, messages, megabytes));
    return kBadInput;
}
