// Compares two pieces of work in one run of Google Benchmark and judges the ratio of their times.
//
// Each comparison registers both sides; all run several times in random order, so that a change of the
// processor's clock or load meets both alike, and the medians are compared. Result prints the ratios after
// Google Benchmark's own table; with --check it is 1 when a ratio is over its limit.
//
//     int main(int argc, char** argv) {
//         RatioBench bench(&argc, argv);
//         bench.Compare("matrix product", 1.0, [&] { ... }, [&] { ... });
//         return bench.Result();
//     }
#pragma once

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

// Makes the compiler believe that the value is read and changed here.
template <class T>
inline void KeepValue(T& value) {
    asm volatile("" : : "r"(&value) : "memory");
}

class RatioBench {
  public:
    // Takes --check out of the arguments and hands the rest to Google Benchmark.
    RatioBench(int* argc, char** argv) : arguments_(argv, argv + *argc) {
        const auto check = std::remove_if(arguments_.begin() + 1, arguments_.end(), [](const char* argument) {
            return strcmp(argument, "--check") == 0;
        });
        check_ = check != arguments_.end();
        arguments_.erase(check, arguments_.end());
        // What the caller gives comes after these defaults and takes their place.
        static char defaults[][56] = {"--benchmark_repetitions=15",
                                      "--benchmark_enable_random_interleaving=true",
                                      "--benchmark_min_time=0.03"};
        for (char* argument : {defaults[2], defaults[1], defaults[0]})
            arguments_.insert(arguments_.begin() + 1, argument);
        int count = static_cast<int>(arguments_.size());
        benchmark::Initialize(&count, arguments_.data());
    }

    // `qex` against `reference`, each a callable of no arguments that makes `items` operations. `limit` is
    // the largest ratio that is accepted.
    template <class Qex, class Reference>
    void Compare(const std::string& name, double limit, Qex qex, Reference reference, double items = 1) {
        comparisons_.push_back({name, limit, items});
        Register(name + " [qex]", qex);
        Register(name + " [reference]", reference);
    }

    // Runs everything; the exit status for main.
    int Result() {
        Collector reporter;
        benchmark::RunSpecifiedBenchmarks(&reporter);
        int over = 0;
        printf("\n%-52s %12s %12s %7s %7s\n", "ratio of medians", "qex ns", "reference ns", "ratio", "limit");
        for (const Comparison& c : comparisons_) {
            const double a = Median(reporter.times[c.name + " [qex]"]) / c.items;
            const double b = Median(reporter.times[c.name + " [reference]"]) / c.items;
            if (!(a > 0) || !(b > 0)) continue;  // filtered out
            printf("%-52s %12.2f %12.2f %7.*f %7.2f%s\n", c.name.c_str(), a, b, a / b < 0.1 ? 4 : 2, a / b,
                   c.limit, a / b > c.limit ? "  OVER" : "");
            over += a / b > c.limit;
        }
        return check_ && over ? 1 : 0;
    }

  private:
    struct Comparison {
        std::string name;
        double limit;
        double items;
    };

    // Google Benchmark's own table without the single repetitions, and their times kept.
    struct Collector : benchmark::ConsoleReporter {
        Collector() : ConsoleReporter(OO_None) {}
        void ReportRuns(const std::vector<Run>& runs) override {
            std::vector<Run> shown;
            for (const Run& run : runs) {
                if (run.run_type == Run::RT_Iteration)
                    times[run.run_name.function_name].push_back(run.GetAdjustedRealTime());
                else if (run.aggregate_name == "median")
                    shown.push_back(run);
            }
            ConsoleReporter::ReportRuns(shown);
        }
        std::map<std::string, std::vector<double>> times;  // nanoseconds
    };

    template <class Work>
    static void Register(const std::string& name, Work work) {
        benchmark::RegisterBenchmark(name.c_str(), [work](benchmark::State& state) mutable {
            for (auto _ : state) work();
        });
    }

    static double Median(std::vector<double>& values) {
        if (values.empty()) return 0;
        const auto middle = values.begin() + static_cast<ptrdiff_t>(values.size() / 2);
        std::nth_element(values.begin(), middle, values.end());
        return *middle;
    }

    std::vector<char*> arguments_;
    std::vector<Comparison> comparisons_;
    bool check_ = false;
};
