// Times RefreshLists: on the shipped database with "Both" chosen, and on a
// user list of a million first and a million last names.
#include "benchsupport.h"
#include "names/namelists.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QTemporaryDir>

#include <sqlite3.h>

#include <algorithm>
#include <cstdio>
#include <random>
#include <vector>

using namespace Qt::StringLiterals;

namespace {

void fillUserList(const QString& path, int count)
{
    sqlite3* db = nullptr;
    sqlite3_open(QFile::encodeName(path).constData(), &db);
    sqlite3_exec(db, "begin", nullptr, nullptr, nullptr);
    std::mt19937 random(7);
    std::uniform_int_distribution<int> letter('a', 'z');
    for (const char* sql : {"insert into user_firstname (firstname) values (?)",
                            "insert into user_lastname (lastname) values (?)"}) {
        sqlite3_stmt* stmt = nullptr;
        sqlite3_prepare_v2(db, sql, -1, &stmt, nullptr);
        for (int i = 0; i < count; ++i) {
            char name[9];
            for (int c = 0; c < 8; ++c)
                name[c] = char(letter(random));
            name[0] = char(name[0] - 'a' + 'A');
            sqlite3_bind_text(stmt, 1, name, 8, SQLITE_TRANSIENT);
            sqlite3_step(stmt);
            sqlite3_reset(stmt);
        }
        sqlite3_finalize(stmt);
    }
    sqlite3_exec(db, "commit", nullptr, nullptr, nullptr);
    sqlite3_close(db);
}

double medianMs(NameLists& lists, const ListChoice& choice, int runs)
{
    std::vector<double> times;
    for (int i = 0; i < runs; ++i) {
        QElapsedTimer timer;
        timer.start();
        lists.RefreshLists(choice);
        times.push_back(double(timer.nsecsElapsed()) / 1e6);
    }
    std::sort(times.begin(), times.end());
    return times[times.size() / 2];
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    QTemporaryDir dir;
    const QString path = Bench::shippedDatabaseCopy(dir);

    NameLists lists(path);
    const double builtIn = medianMs(lists, ListChoice{true, false, true, false, false}, 9);
    std::printf(
        "RefreshLists, built-in list, Both: %lld + %lld names, median %.1f ms (goal 100 ms)\n",
        static_cast<long long>(lists.firstPane().count()),
        static_cast<long long>(lists.lastPane().count()), builtIn);

    fillUserList(path, 1000000);
    const double user = medianMs(lists, ListChoice{false, true, true, false, false}, 3);
    std::printf("RefreshLists, user list: %lld + %lld names, median %.1f ms (goal 1500 ms)\n",
                static_cast<long long>(lists.firstPane().count()),
                static_cast<long long>(lists.lastPane().count()), user);
    return 0;
}
