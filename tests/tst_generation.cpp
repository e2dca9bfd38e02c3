// Generation without windows: the count box's reading, the tidying of names,
// the draws and the progress a run reports, and the streamed runs of the
// command line: jumps, shards and the permutation of distinct pairs.
#include "generate/generation.h"
#include "generate/namerun.h"
#include "support/randomindex.h"

#include <QTest>

#include <cmath>
#include <numeric>
#include <set>

using namespace Qt::StringLiterals;

namespace {

// A pane of names that are numbers: 0, 1, ...
QStringList pane(int names)
{
    QStringList pane;
    for (int i = 0; i < names; ++i)
        pane.append(QString::number(i));
    return pane;
}

} // namespace

class TestGeneration : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsTheCount_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("reading"); // the count, or why there is none
        QTest::addColumn<QString>("locale");  // the user's number format
        QTest::newRow("one million passes") << u"1000000"_s << u"1000000"_s << u"C"_s;
        QTest::newRow("one million and one refused") << u"1000001"_s << u"too many"_s << u"C"_s;
        QTest::newRow("just below the bound") << u"1000000.6"_s << u"1000001"_s << u"C"_s;
        QTest::newRow("2.5 to even 2") << u"2.5"_s << u"2"_s << u"C"_s;
        QTest::newRow("3.5 to even 4") << u"3.5"_s << u"4"_s << u"C"_s;
        QTest::newRow("blanks around") << u"  250 \t"_s << u"250"_s << u"C"_s;
        QTest::newRow("below 32 bits makes none") << u"-3e9"_s << u"0"_s << u"C"_s;
        QTest::newRow("digits then words") << u"12 names"_s << u"no number"_s << u"C"_s;
        QTest::newRow("nan") << u"nan"_s << u"no number"_s << u"C"_s;
        QTest::newRow("grouped") << u"1.000.001"_s << u"too many"_s << u"de_DE"_s;
        QTest::newRow("grouped, English") << u"1,000"_s << u"1000"_s << u"en_US"_s;
    }

    void readsTheCount()
    {
        QFETCH(QString, text);
        QFETCH(QString, locale);
        const CountText read(text, QLocale(locale));
        QTEST(!read.isNumber() ? u"no number"_s
              : read.tooMany() ? u"too many"_s
                               : QString::number(read.count()),
              "reading");
    }

    void tidiesNames_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<QString>("properCase");
        QTest::addColumn<QString>("tidied");

        QTest::newRow("JOHN") << u"JOHN"_s << u"John"_s << u"John"_s;
        QTest::newRow("o'neil") << u"o'neil"_s << u"O'neil"_s << u"O'neil"_s;
        QTest::newRow("anne-marie") << u"anne-marie"_s << u"Anne-marie"_s << u"Anne-marie"_s;
        QTest::newRow("mcdonald") << u"mcdonald"_s << u"Mcdonald"_s << u"Mcdonald"_s;
        QTest::newRow("\" mary ann \"") << u" mary ann "_s << u" Mary Ann "_s << u"Maryann"_s;
        QTest::newRow("only spaces go, a tab starts a capital")
            << u" a b\tc\u00a0d  "_s << u" A B\tC\u00a0d  "_s << u"Ab\tC\u00a0d"_s;
        QTest::newRow("CR starts a capital") << u"anna\rlee"_s << u"Anna\rLee"_s << u"Anna\rLee"_s;
    }

    void tidiesNames()
    {
        QFETCH(QString, stored);
        QTEST(ProperCase(stored), "properCase");
        QTEST(tidyName(stored), "tidied");
    }

    void replaysFromTheSeedLastNameFirst()
    {
        const QStringList firsts{u"ann"_s, u"BOB"_s, u" cy "_s, u"dee"_s, u"eve"_s};
        const QStringList lasts{u"SMITH"_s, u"o'brien"_s, u"lee"_s};
        RandomSource random;
        random.seed(42);
        RandomSource replay = random;
        const GeneratedNames names = NameGenerator(firsts, lasts, random).generate(500);

        QCOMPARE(names.rows.size(), std::size_t(500));
        for (const NamePair& row : names.rows) {
            QCOMPARE(names.lastNames.at(row.last),
                     tidyName(lasts.at(int(RandomIndex(replay, 3)) - 1)));
            QCOMPARE(names.firstNames.at(row.first),
                     tidyName(firsts.at(int(RandomIndex(replay, 5)) - 1)));
        }
        // Two draws a name and no more: both sources stand at the same place.
        QCOMPARE(random.nextBits(), replay.nextBits());
    }

    // Every item of a pane comes up about as often as the others, in both
    // panes: within five standard deviations of an equal share (all of them
    // for a pane of one).
    void drawsAreFair()
    {
        constexpr int Names = 400000;
        for (const int items : {1, 2, 7, 97}) {
            RandomSource random;
            const GeneratedNames names =
                NameGenerator(pane(items), pane(items), random).generate(Names);
            QList<int> drawn(2 * items);
            for (const NamePair& row : names.rows) {
                ++drawn[names.firstNames.at(row.first).toInt()];
                ++drawn[items + names.lastNames.at(row.last).toInt()];
            }
            const double sigma = std::sqrt(Names * (1.0 / items) * (1 - 1.0 / items));
            for (const int n : drawn)
                QVERIFY(std::abs(n - Names / double(items)) <= 5 * sigma);
        }
    }

    void progressFollowsTheRun_data()
    {
        QTest::addColumn<int>("count");
        QTest::addColumn<QList<int>>("values");
        QList<int> everyValue(101);
        std::iota(everyValue.begin(), everyValue.end(), 0);
        QTest::newRow("three") << 3 << QList<int>{33, 67, 100};
        QTest::newRow("halves to even") << 8 << QList<int>{12, 25, 38, 50, 62, 75, 88, 100};
        QTest::newRow("long run: each value once") << 123457 << everyValue;
    }

    void progressFollowsTheRun()
    {
        QFETCH(int, count);
        RandomSource random;
        QList<int> seen;
        NameGenerator(pane(2), pane(2), random).generate(count, [&](int v) { seen.append(v); });
        QTEST(seen, "values");
    }

    // A jump lands where drawing would: checked by drawing for short jumps
    // and by two jumps against one for long ones.
    void jumpsWhereDrawingGoes_data()
    {
        QTest::addColumn<quint64>("first");
        QTest::addColumn<quint64>("second");
        QTest::newRow("none") << quint64(0) << quint64(0);
        QTest::newRow("one") << quint64(1) << quint64(0);
        QTest::newRow("across a word of bits") << quint64(63) << quint64(66);
        QTest::newRow("a long run's block") << quint64(65536) << quint64(12345);
        QTest::newRow("far") << (quint64(1) << 40) << (quint64(3) << 61);
    }

    void jumpsWhereDrawingGoes()
    {
        QFETCH(quint64, first);
        QFETCH(quint64, second);
        RandomSource jumped;
        jumped.seed(99);
        RandomSource reference = jumped;
        jumped.jump(first);
        jumped.jump(second);
        if (first + second < 1000000) {
            for (quint64 i = 0; i < first + second; ++i)
                reference.nextBits();
        } else {
            reference.jump(first + second);
        }
        QCOMPARE(jumped.nextBits(), reference.nextBits());
    }

    // Shards one after another are the whole run, each starting on a unit.
    void shardsCoverTheRun_data()
    {
        QTest::addColumn<qint64>("count");
        QTest::addColumn<int>("shards");
        QTest::addColumn<qint64>("unit");
        QTest::newRow("one shard") << qint64(10) << 1 << qint64(1);
        QTest::newRow("fewer rows than shards") << qint64(3) << 7 << qint64(1);
        QTest::newRow("uneven") << qint64(1001) << 3 << qint64(1);
        QTest::newRow("statements kept whole") << qint64(2500) << 7 << qint64(1000);
        QTest::newRow("near 2^63") << qint64(0x7fff'ffff'ffff'fff0) << 7 << qint64(1000);
    }

    void shardsCoverTheRun()
    {
        QFETCH(qint64, count);
        QFETCH(int, shards);
        QFETCH(qint64, unit);
        std::int64_t next = 0;
        std::int64_t fewest = count;
        std::int64_t most = 0;
        for (int shard = 1; shard <= shards; ++shard) {
            const RowRange rows = shardRows(count, shard, shards, unit);
            QCOMPARE(rows.begin, next);
            QVERIFY(rows.end >= rows.begin);
            QVERIFY(rows.begin % unit == 0);
            next = rows.end;
            if (shard < shards) {
                fewest = std::min(fewest, rows.size());
                most = std::max(most, rows.size());
            }
        }
        QCOMPARE(next, count);
        QVERIFY(shards == 1 || most - fewest <= unit);
    }

    // Over many seeds every distinct pair comes first, and comes among the
    // first few rows, about as often as any other: within five standard
    // deviations of an equal share. Pair counts just past a power of two
    // and odd bit widths are where a faulty permutation repeats or skips.
    void distinctPairsAreFair_data()
    {
        QTest::addColumn<int>("firsts");
        QTest::addColumn<int>("lasts");
        QTest::addColumn<int>("rows");
        QTest::newRow("1 x 1") << 1 << 1 << 1;
        QTest::newRow("3 x 2, first row") << 3 << 2 << 1;
        QTest::newRow("3 x 2, three rows") << 3 << 2 << 3;
        QTest::newRow("4 x 4, three rows") << 4 << 4 << 3;
        QTest::newRow("7 x 11, first row") << 7 << 11 << 1;
        QTest::newRow("5 x 13, ten rows") << 5 << 13 << 10;
    }

    void distinctPairsAreFair()
    {
        QFETCH(int, firsts);
        QFETCH(int, lasts);
        QFETCH(int, rows);
        constexpr int Seeds = 20000;
        const QStringList firstPane = pane(firsts);
        const QStringList lastPane = pane(lasts);
        const int pairs = firsts * lasts;
        std::vector<int> drawn(static_cast<std::size_t>(pairs));
        std::vector<NamePair> made(static_cast<std::size_t>(rows));
        for (int seed = 0; seed < Seeds; ++seed) {
            RandomSource random;
            random.seed(std::uint64_t(seed));
            const NameRun run(firstPane, lastPane, random, {.count = rows, .unique = true});
            run.pairs(0, made);
            std::set<int> distinct;
            for (const NamePair& pair : made)
                distinct.insert(int(pair.first) * lasts + int(pair.last));
            QCOMPARE(int(distinct.size()), rows);
            for (const int pair : distinct)
                ++drawn[std::size_t(pair)];
        }
        const double share = double(rows) / pairs;
        const double sigma = std::sqrt(Seeds * share * (1 - share));
        for (const int n : drawn)
            QVERIFY2(std::abs(n - Seeds * share) <= 5 * sigma,
                     qPrintable(u"%1 of %2"_s.arg(n).arg(Seeds * share)));
    }
};

QTEST_GUILESS_MAIN(TestGeneration)
#include "tst_generation.moc"
