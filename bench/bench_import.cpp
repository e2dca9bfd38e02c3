// Times the import of a text file of a million first names into the user
// list, then the refresh that shows them, and the import of one 200 MB line.
#include "benchsupport.h"
#include "names/listoperations.h"
#include "names/namelists.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QTemporaryDir>

#include <cstdio>
#include <optional>
#include <random>

using namespace Qt::StringLiterals;

namespace {

void writeNames(const QString& path, int count)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        std::abort();
    std::mt19937 random(11);
    std::uniform_int_distribution<int> letter('a', 'z');
    std::uniform_int_distribution<int> length(4, 10);
    QByteArray bytes;
    for (int i = 0; i < count; ++i) {
        const int n = length(random);
        bytes += char(letter(random) - 'a' + 'A');
        for (int c = 1; c < n; ++c)
            bytes += char(letter(random));
        bytes += "\r\n";
        if (bytes.size() > 1 << 20) {
            file.write(bytes);
            bytes.clear();
        }
    }
    file.write(bytes);
}

double seconds(const QElapsedTimer& timer)
{
    return double(timer.nsecsElapsed()) / 1e9;
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    QTemporaryDir dir;
    const QString db = Bench::shippedDatabaseCopy(dir);

    constexpr int Count = 1'000'000;
    const QString names = dir.filePath(u"names.txt"_s);
    writeNames(names, Count);

    const ListChoice user{false, true, true, false, false};
    NameLists lists(db);
    // The import over a connection of its own per file, as the window runs it.
    int problems = 0;
    const auto importFile = [&](const QString& path, ListKind kind) {
        std::optional<Connection> connection;
        importNameFile([&]() -> Connection& { return connection.emplace(db); }, path, kind, user,
                       [&](const ImportProblem& problem) {
                           ++problems;
                           std::printf("problem: %s\n", qUtf8Printable(problem.description));
                       });
    };

    // One line of 200 MB: refused as one overlong name, in bounded memory.
    const QString line = dir.filePath(u"line.txt"_s);
    {
        QFile file(line);
        file.open(QIODevice::WriteOnly);
        const QByteArray block(1 << 20, 'q');
        for (int i = 0; i < 200; ++i)
            file.write(block);
    }
    const long before = Bench::peakKilobytes() / 1024;
    QElapsedTimer timer;
    timer.start();
    importFile(line, ListKind::LastNames);
    std::printf("FileToListview, one line of 200 MB: %.2f s, %d problem(s), peak memory %ld MB "
                "(%ld MB before)\n",
                seconds(timer), problems, Bench::peakKilobytes() / 1024, before);
    timer.restart();
    double cpu = Bench::processorMs() / 1e3;
    importFile(names, ListKind::FirstNames);
    const double import = seconds(timer);
    const double importCpu = Bench::processorMs() / 1e3 - cpu;
    timer.restart();
    cpu = Bench::processorMs() / 1e3;
    lists.RefreshLists(user);
    const double refresh = seconds(timer);
    const double refreshCpu = Bench::processorMs() / 1e3 - cpu;
    std::printf("FileToListview, %d first names into the user list: %.2f s, processor %.2f s "
                "(goal 3 s)\n",
                Count, import, importCpu);
    std::printf("RefreshLists showing them: %lld first names, %.2f s, processor %.2f s (goal "
                "1.5 s)\n",
                static_cast<long long>(lists.firstPane().count()), refresh, refreshCpu);
    std::printf("problems: %d; peak memory %ld MB\n", problems, Bench::peakKilobytes() / 1024);

    return 0;
}
