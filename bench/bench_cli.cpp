// Times quillane-cli as a script runs it, as a whole process, on a copy of
// the shipped database: the wall time (median of several runs) and the peak
// memory of each run, and the time per name as the count grows. Big output
// files are removed after each run.
//
//   bench_cli          every case
//   bench_cli quick    the cases up to ten million names
#include "benchsupport.h"

#include <QFile>
#include <QTemporaryDir>

#include <algorithm>
#include <cstdio>
#include <vector>

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <time.h>

extern char** environ;

namespace {

constexpr double LimitMB = 64;

struct Measure {
    double ms = 0;
    double peakMB = 0;
    int status = -1;
};

double now()
{
    timespec t{};
    clock_gettime(CLOCK_MONOTONIC, &t);
    return double(t.tv_sec) * 1e3 + double(t.tv_nsec) / 1e6;
}

// One whole run: from the fork to the reaped exit, and the child's peak
// resident memory as the kernel kept it. Standard output goes to /dev/null.
Measure runOnce(const std::vector<QByteArray>& arguments)
{
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    std::vector<char*> argv;
    for (const QByteArray& argument : arguments)
        argv.push_back(const_cast<char*>(argument.constData()));
    argv.push_back(nullptr);
    Measure measure;
    const double start = now();
    pid_t pid = 0;
    const int spawned = posix_spawn(&pid, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (spawned != 0)
        return measure;
    int status = 0;
    rusage usage{};
    wait4(pid, &status, 0, &usage);
    measure.ms = now() - start;
    measure.peakMB = double(usage.ru_maxrss) / 1024.0;
    measure.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return measure;
}

struct Case {
    const char* label;
    std::vector<QByteArray> options; // after "generate"
    double names;
    int runs;
    double limitMs; // 0: no limit of its own
    bool toFile;    // -o FILE, removed after each run; else standard output
};

} // namespace

int main(int argc, char** argv)
{
    const bool quick = argc > 1 && QByteArray(argv[1]) == "quick";
    QTemporaryDir folder;
    const QString database = Bench::shippedDatabaseCopy(folder);
    const QByteArray output = QFile::encodeName(folder.filePath(QStringLiteral("names.out")));

    const std::vector<Case> cases = {
        {"1M text to a file (the first benchmark)",
         {"-n", "1000000", "--format", "text"},
         1e6,
         7,
         500,
         true},
        {"1M --unique lines to a file", {"-n", "1000000", "--unique"}, 1e6, 7, 400, true},
        {"1M lines to /dev/null", {"-n", "1000000"}, 1e6, 7, 0, false},
        {"10M lines to /dev/null", {"-n", "10000000"}, 1e7, 5, 0, false},
        {"100M lines to /dev/null", {"-n", "100000000"}, 1e8, 3, 3000, false},
        {"100M lines to a file", {"-n", "100000000"}, 1e8, 3, 6000, true},
    };

    bool ok = true;
    for (const Case& c : cases) {
        if (quick && c.names > 1e7)
            continue;
        std::vector<QByteArray> arguments{QByteArray(QUILLANE_CLI), "--database",
                                          QFile::encodeName(database), "generate"};
        arguments.insert(arguments.end(), c.options.begin(), c.options.end());
        if (c.toFile)
            arguments.insert(arguments.end(), {"-o", output});

        if (c.names <= 1e6)
            runOnce(arguments); // the files and the program into the page cache
        std::vector<Measure> runs;
        double fileMB = 0;
        for (int i = 0; i < c.runs; ++i) {
            runs.push_back(runOnce(arguments));
            fileMB = double(QFile(QFile::decodeName(output)).size()) / 1e6;
            QFile::remove(QFile::decodeName(output));
        }
        if (std::any_of(runs.begin(), runs.end(), [](const Measure& m) { return m.status != 0; })) {
            std::printf("%s: quillane-cli failed\n", c.label);
            return 1;
        }
        std::sort(runs.begin(), runs.end(),
                  [](const Measure& a, const Measure& b) { return a.ms < b.ms; });
        const Measure& median = runs[runs.size() / 2];
        double peak = 0;
        for (const Measure& m : runs)
            peak = std::max(peak, m.peakMB);
        const bool fine = (c.limitMs == 0 || median.ms <= c.limitMs) && peak <= LimitMB;
        ok = ok && fine;
        std::printf("%-42s median %6.0f ms, best %6.0f ms", c.label, median.ms, runs.front().ms);
        if (c.limitMs > 0)
            std::printf(" (limit %.0f)", c.limitMs);
        std::printf("; %.1f ns a name; peak %.1f MB (limit %.0f)", median.ms * 1e6 / c.names, peak,
                    LimitMB);
        if (c.toFile)
            std::printf("; file %.1f MB", fileMB);
        std::printf(": %s\n", fine ? "ok" : "OVER");
        std::fflush(stdout);
    }
    return ok ? 0 : 1;
}
