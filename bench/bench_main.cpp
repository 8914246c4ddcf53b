// Entry of every benchmark program: the usual console output, then one
// summary table. A case is a benchmark name with its "zor_<level>" part
// taken out; its peers are the benchmarks registered as "<case>/<peer>"
// (opencv, fftw, memcpy, ...). Each row gives the fastest level, its time,
// and each peer's time with the ratio peer / best level (above 1: zor is
// faster).
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdio>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace {

struct Summary {
    struct Case {
        std::string best_level;
        double best_ns = 0;
        std::map<std::string, double> peers;  // peer -> ns
    };
    std::map<std::string, Case> cases;
    std::map<std::string, std::map<std::string, double>> others;  // "<case>" -> peer -> ns
};

double to_ns(const benchmark::BenchmarkReporter::Run& run) {
    static const double scale[] = {1, 1e3, 1e6, 1e9};  // kNanosecond .. kSecond
    return run.GetAdjustedRealTime() * scale[run.time_unit];
}

class SummaryReporter : public benchmark::ConsoleReporter {
public:
    SummaryReporter() : ConsoleReporter(isatty(1) ? OO_ColorTabular : OO_Tabular) {}
    Summary summary;

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            if (run.error_occurred || run.run_type != Run::RT_Iteration) continue;
            record(run.benchmark_name(), to_ns(run));
        }
    }

private:
    void record(const std::string& name, double ns) {
        const size_t at = name.find("zor_");
        if (at != std::string::npos && (at == 0 || name[at - 1] == '/')) {
            const size_t end = name.find('/', at);
            const std::string level = name.substr(at + 4, end == std::string::npos ? end : end - at - 4);
            std::string key = name.substr(0, at ? at - 1 : 0);
            if (end != std::string::npos) key += name.substr(end);
            Summary::Case& c = summary.cases[key];
            if (c.best_level.empty() || ns < c.best_ns) c.best_level = level, c.best_ns = ns;
            return;
        }
        const size_t slash = name.rfind('/');
        if (slash != std::string::npos) summary.others[name.substr(0, slash)][name.substr(slash + 1)] = ns;
    }
};

std::string format_time(double ns) {
    static const char* const units[] = {"ns", "us", "ms", "s"};
    int u = 0;
    while (ns >= 1000 && u < 3) ns /= 1000, ++u;
    char text[32];
    std::snprintf(text, sizeof text, "%.3g %s", ns, units[u]);
    return text;
}

void print_summary(Summary& s) {
    if (s.cases.empty()) return;
    std::set<std::string> peer_names;
    size_t width = 4;
    for (auto& [key, c] : s.cases) {
        width = std::max(width, key.size());
        auto other = s.others.find(key);
        if (other == s.others.end()) continue;
        c.peers = other->second;
        for (const auto& [peer, ns] : c.peers) peer_names.insert(peer);
    }
    std::printf("\nSummary (ratio: peer time / best zor level)\n%-*s  %-5s %10s", (int)width, "case", "level",
                "time");
    for (const std::string& peer : peer_names) std::printf("  %20s", peer.c_str());
    std::printf("\n");
    for (const auto& [key, c] : s.cases) {
        std::printf("%-*s  %-5s %10s", (int)width, key.c_str(), c.best_level.c_str(),
                    format_time(c.best_ns).c_str());
        for (const std::string& peer : peer_names) {
            auto p = c.peers.find(peer);
            if (p == c.peers.end()) {
                std::printf("  %20s", "-");
                continue;
            }
            char cell[48];
            std::snprintf(cell, sizeof cell, "%s (%.2fx)", format_time(p->second).c_str(), p->second / c.best_ns);
            std::printf("  %20s", cell);
        }
        std::printf("\n");
    }
}

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
    SummaryReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    print_summary(reporter.summary);
    return 0;
}
