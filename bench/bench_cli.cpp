// Times quillane-cli as a script runs it, as a whole process: one million
// names in the results file's text format to a file, on a copy of the
// shipped database, with the process's wall time and peak memory.
#include "benchsupport.h"

#include <QFile>
#include <QTemporaryDir>

#include <algorithm>
#include <cstdio>
#include <vector>

#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <time.h>

extern char** environ;

namespace {

constexpr double LimitMs = 500;
constexpr double LimitMB = 64;
constexpr int Runs = 7;

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
// resident memory as the kernel kept it.
Measure runOnce(const std::vector<QByteArray>& arguments)
{
    std::vector<char*> argv;
    for (const QByteArray& argument : arguments)
        argv.push_back(const_cast<char*>(argument.constData()));
    argv.push_back(nullptr);
    Measure measure;
    const double start = now();
    pid_t pid = 0;
    if (posix_spawn(&pid, argv[0], nullptr, nullptr, argv.data(), environ) != 0)
        return measure;
    int status = 0;
    rusage usage{};
    wait4(pid, &status, 0, &usage);
    measure.ms = now() - start;
    measure.peakMB = double(usage.ru_maxrss) / 1024.0;
    measure.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return measure;
}

} // namespace

int main()
{
    QTemporaryDir folder;
    const QString database = Bench::shippedDatabaseCopy(folder);
    const QString output = folder.filePath(QStringLiteral("names.txt"));
    const std::vector<QByteArray> arguments{QByteArray(QUILLANE_CLI),
                                            "--database",
                                            QFile::encodeName(database),
                                            "generate",
                                            "-n",
                                            "1000000",
                                            "--format",
                                            "text",
                                            "-o",
                                            QFile::encodeName(output)};

    runOnce(arguments); // the files and the program into the page cache
    std::vector<Measure> runs;
    for (int i = 0; i < Runs; ++i)
        runs.push_back(runOnce(arguments));
    if (std::any_of(runs.begin(), runs.end(), [](const Measure& m) { return m.status != 0; })) {
        std::printf("quillane-cli failed\n");
        return 1;
    }
    std::sort(runs.begin(), runs.end(),
              [](const Measure& a, const Measure& b) { return a.ms < b.ms; });
    const Measure& median = runs[Runs / 2];
    double peak = 0;
    for (const Measure& m : runs)
        peak = std::max(peak, m.peakMB);
    const bool ok = median.ms <= LimitMs && peak <= LimitMB;
    std::printf("quillane-cli generate -n 1000000 --format text -o FILE: median %.0f ms, best %.0f "
                "ms (limit %.0f); peak memory %.1f MB (limit %.0f); file %.1f MB: %s\n",
                median.ms, runs.front().ms, LimitMs, peak, LimitMB,
                double(QFile(output).size()) / 1e6, ok ? "ok" : "OVER");
    return ok ? 0 : 1;
}
