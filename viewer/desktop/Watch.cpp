// Times and sizes, looked at now and then.
#include "desktop/Watch.h"

namespace {

constexpr double kPause = 0.3;  // seconds

}  // namespace

Watch::Seen Watch::Look(const std::string& file) {
    std::error_code missing, none;
    const Seen seen = {std::filesystem::last_write_time(file, missing),
                       std::filesystem::file_size(file, none)};
    return missing || none ? Seen{} : seen;
}

void Watch::Set(const std::vector<std::string>& files) {
    std::map<std::string, Seen> now;
    for (const std::string& file : files) {
        const auto known = loaded_.find(file);
        now[file] = known == loaded_.end() ? Look(file) : known->second;
    }
    loaded_ = last_ = std::move(now);
}

bool Watch::Changed(double seconds) {
    since_ += seconds;
    if (since_ < kPause) return false;
    since_ = 0;
    bool changed = false;
    for (auto& [file, loaded] : loaded_) {
        const Seen now = Look(file);
        // A file that is being written has another size each time, one that is being replaced is gone.
        const bool still = now == last_[file] && !(now == Seen{});
        last_[file] = now;
        if (!still || now == loaded) continue;
        loaded = now;
        changed = true;
    }
    return changed;
}
