// Generation without windows: the count box's reading, the tidying of names,
// the draws and the progress a run reports.
#include "generate/generation.h"
#include "support/randomindex.h"

#include <QTest>

#include <cmath>
#include <numeric>

using namespace Qt::StringLiterals;

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
        QTest::newRow("decimal comma") << u"2,5"_s << u"2"_s << u"de_DE"_s;
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
        QTest::newRow("SMITH") << u"SMITH"_s << u"Smith"_s << u"Smith"_s;
        QTest::newRow("o'brien") << u"o'brien"_s << u"O'brien"_s << u"O'brien"_s;
        QTest::newRow("tab starts a capital") << u"anna\tLEE"_s << u"Anna\tLee"_s << u"Anna\tLee"_s;
        QTest::newRow("CR starts a capital") << u"anna\rlee"_s << u"Anna\rLee"_s << u"Anna\rLee"_s;
    }

    void tidiesNames()
    {
        QFETCH(QString, stored);
        QTEST(ProperCase(stored), "properCase");
        QTEST(tidyName(stored), "tidied");
    }

    void stripsOnlySpaces() { QCOMPARE(StripSpaces(u" a b\tc\u00a0d  "_s), u"ab\tc\u00a0d"_s); }

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
            QStringList pane;
            for (int i = 0; i < items; ++i)
                pane.append(QString::number(i));
            RandomSource random;
            const GeneratedNames names = NameGenerator(pane, pane, random).generate(Names);
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
        const QStringList pane{u"a"_s, u"b"_s};
        RandomSource random;
        QList<int> seen;
        NameGenerator(pane, pane, random).generate(count, [&](int v) { seen.append(v); });
        QTEST(seen, "values");
    }
};

QTEST_GUILESS_MAIN(TestGeneration)
#include "tst_generation.moc"
