// Files that may be written anew.
#pragma once

#include <filesystem>
#include <map>
#include <string>
#include <vector>

class Watch {
  public:
    // These from now on; those that were watched before keep their times.
    void Set(const std::vector<std::string>& files);
    // Looks each 0.3 s. Whether one of them has changed and has been still since the last look.
    bool Changed(double seconds);

  private:
    struct Seen {
        std::filesystem::file_time_type time;
        uintmax_t size;
        bool operator==(const Seen& o) const { return time == o.time && size == o.size; }
    };
    static Seen Look(const std::string& file);

    std::map<std::string, Seen> loaded_, last_;
    double since_ = 0;
};
