// "qex convert" of this very program, its output and messages in a temporary folder.
#include "desktop/Conversion.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "desktop/Child.h"

Conversion::~Conversion() {
    Stop();
}

void Conversion::Stop() {
    if (child_ > 0) {
        kill(child_, SIGTERM);
        waitpid(child_, nullptr, 0);
    }
    child_ = 0;
    std::error_code ignored;
    if (!folder_.empty()) std::filesystem::remove_all(folder_, ignored);
    folder_.clear();
}

bool Conversion::Start(const std::string& input, std::optional<size_t> clip, std::string* problem) {
    Stop();
    input_ = input;
    std::string pattern = (std::filesystem::temp_directory_path() / "qex-view-XXXXXX").string();
    if (!mkdtemp(&pattern[0])) {
        *problem = std::string("no temporary folder: ") + strerror(errno);
        return false;
    }
    folder_ = pattern;
    // A name that begins with a minus is no option.
    const std::string from = std::filesystem::absolute(input).string(), to = Output(),
                      said = folder_ + "/said";
    const int messages = open(said.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    std::vector<std::string> words = {"convert", from, "-o", to, "--quiet", "--clips-to", folder_ + "/clips"};
    if (clip) words.push_back("--clip=" + std::to_string(*clip));
    child_ = StartQex(words, messages);
    const int error = errno;
    if (messages >= 0) close(messages);
    if (child_ > 0) return true;
    *problem = std::string("no process can be started for it: ") + strerror(error);
    child_ = 0;
    return false;
}

std::vector<std::string> Conversion::Clips() const {
    std::vector<std::string> names;
    std::ifstream list(folder_ + "/clips");
    for (std::string line; std::getline(list, line);) names.push_back(line);
    return names;
}

Conversion::State Conversion::Poll(std::string* problem) {
    int status = 0;
    if (child_ <= 0) return State::kNone;
    const pid_t ended = waitpid(child_, &status, WNOHANG);
    if (ended == 0 || (ended < 0 && errno == EINTR)) return State::kAtWork;
    child_ = 0;
    if (WIFEXITED(status) && WEXITSTATUS(status) == 0) return State::kDone;
    std::ifstream said(folder_ + "/said");
    for (std::string line; std::getline(said, line);)
        if (line.find("warning: ") == std::string::npos) *problem = line;
    if (problem->empty()) *problem = input_ + ": cannot be converted";
    return State::kFailed;
}
