// Generation without windows: the count box's reading, the refusals, the
// tidying of names, the draws and the rows, and the results list's model.
#include "generate/generation.h"
#include "results/resultsmodel.h"

#include <QHash>
#include <QSet>
#include <QSignalSpy>
#include <QTest>

#include <cmath>
#include <limits>

using namespace Qt::StringLiterals;

namespace {

const QLocale C = QLocale::c();
const QLocale German(QLocale::German, QLocale::Germany);
const QLocale English(QLocale::English, QLocale::UnitedStates);

QStringList firstColumn(const GeneratedNames& names)
{
    QStringList column;
    for (const NamePair& row : names.rows)
        column.append(names.firstNames.at(row.first));
    return column;
}

QStringList lastColumn(const GeneratedNames& names)
{
    QStringList column;
    for (const NamePair& row : names.rows)
        column.append(names.lastNames.at(row.last));
    return column;
}

} // namespace

class TestGeneration : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsTheCount_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QLocale>("locale");
        QTest::addColumn<bool>("isNumber");
        QTest::addColumn<bool>("tooMany");
        QTest::addColumn<int>("count");

        QTest::newRow("one million passes") << u"1000000"_s << C << true << false << 1000000;
        QTest::newRow("one million and one is refused") << u"1000001"_s << C << true << true << 0;
        QTest::newRow("just below the bound rounds up to it")
            << u"1000000.6"_s << C << true << false << 1000001;
        QTest::newRow("2.5 rounds to even 2") << u"2.5"_s << C << true << false << 2;
        QTest::newRow("3.5 rounds to even 4") << u"3.5"_s << C << true << false << 4;
        QTest::newRow("-2.5 rounds to even -2") << u"-2.5"_s << C << true << false << -2;
        QTest::newRow("2.6 rounds up") << u"2.6"_s << C << true << false << 3;
        QTest::newRow("blanks around") << u"  250 \t"_s << C << true << false << 250;
        QTest::newRow("zero") << u"0"_s << C << true << false << 0;
        QTest::newRow("negative") << u"-7"_s << C << true << false << -7;
        QTest::newRow("lowest 32-bit")
            << u"-2147483648"_s << C << true << false << std::numeric_limits<int>::min();
        QTest::newRow("below the 32-bit range makes none")
            << u"-3000000000"_s << C << true << false << 0;
        QTest::newRow("empty") << QString() << C << false << false << 0;
        QTest::newRow("blanks only") << u"   "_s << C << false << false << 0;
        QTest::newRow("words") << u"lots"_s << C << false << false << 0;
        QTest::newRow("digits then words") << u"12 names"_s << C << false << false << 0;
        QTest::newRow("not a number") << u"nan"_s << C << false << false << 0;
        QTest::newRow("infinity") << u"inf"_s << C << false << false << 0;
        QTest::newRow("too big for a real") << u"1e400"_s << C << false << false << 0;
        QTest::newRow("German decimal comma") << u"2,5"_s << German << true << false << 2;
        QTest::newRow("German grouping") << u"1.000"_s << German << true << false << 1000;
        QTest::newRow("English grouping") << u"1,000"_s << English << true << false << 1000;
        QTest::newRow("English grouping at the bound")
            << u"1,000,001"_s << English << true << true << 0;
    }

    void readsTheCount()
    {
        QFETCH(QString, text);
        QFETCH(QLocale, locale);
        QFETCH(bool, isNumber);
        QFETCH(bool, tooMany);
        QFETCH(int, count);

        const CountText read(text, locale);
        QCOMPARE(read.isNumber(), isNumber);
        QCOMPARE(read.tooMany(), tooMany);
        QCOMPARE(read.count(), count);
    }

    void refusalsComeInTheirOrder_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<int>("firstNames");
        QTest::addColumn<int>("lastNames");
        QTest::addColumn<QString>("refusal");

        QTest::newRow("both panes empty") << u"5"_s << 0 << 0 << GenerationMessages::NoFirstName;
        QTest::newRow("bound before the panes")
            << u"2000000"_s << 0 << 0 << GenerationMessages::TooMany;
        QTest::newRow("last pane empty") << u"5"_s << 3 << 0 << GenerationMessages::NoLastName;
        QTest::newRow("not a number, first pane empty")
            << u"many"_s << 0 << 3 << GenerationMessages::NoFirstName;
        QTest::newRow("not a number, last pane empty")
            << u"many"_s << 3 << 0 << GenerationMessages::NoLastName;
        QTest::newRow("not a number, panes full: refused later")
            << u"many"_s << 3 << 3 << QString();
        QTest::newRow("a good request") << u"5"_s << 3 << 3 << QString();
    }

    void refusalsComeInTheirOrder()
    {
        QFETCH(QString, text);
        QFETCH(int, firstNames);
        QFETCH(int, lastNames);
        QFETCH(QString, refusal);
        QCOMPARE(refusalBeforeStart(CountText(text, C), firstNames, lastNames), refusal);
    }

    void tidiesNames_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<QString>("properCase");
        QTest::addColumn<QString>("tidied");

        QTest::newRow("capitals") << u"JOHN"_s << u"John"_s << u"John"_s;
        QTest::newRow("apostrophe") << u"o'neil"_s << u"O'neil"_s << u"O'neil"_s;
        QTest::newRow("hyphen") << u"anne-marie"_s << u"Anne-marie"_s << u"Anne-marie"_s;
        QTest::newRow("prefix") << u"mcdonald"_s << u"Mcdonald"_s << u"Mcdonald"_s;
        QTest::newRow("full stop") << u"st.john"_s << u"St.john"_s << u"St.john"_s;
        QTest::newRow("blanks before, inside, after")
            << u" mary ann "_s << u" Mary Ann "_s << u"Maryann"_s;
        QTest::newRow("several words") << u"van der berg"_s << u"Van Der Berg"_s << u"Vanderberg"_s;
        QTest::newRow("SMITH") << u"SMITH"_s << u"Smith"_s << u"Smith"_s;
        QTest::newRow("o'brien") << u"o'brien"_s << u"O'brien"_s << u"O'brien"_s;
        QTest::newRow("tab starts a capital") << u"anna\tLEE"_s << u"Anna\tLee"_s << u"Anna\tLee"_s;
        QTest::newRow("CR starts a capital") << u"anna\rlee"_s << u"Anna\rLee"_s << u"Anna\rLee"_s;
        QTest::newRow("LF does not") << u"anna\nlee"_s << u"Anna\nlee"_s << u"Anna\nlee"_s;
        QTest::newRow("no-break space stays")
            << u"anna\u00a0lee"_s << u"Anna\u00a0lee"_s << u"Anna\u00a0lee"_s;
        QTest::newRow("spaces only") << u"   "_s << u"   "_s << QString();
        QTest::newRow("empty") << QString() << QString() << QString();
        QTest::newRow("accents") << u"ÉLODIE"_s << u"Élodie"_s << u"Élodie"_s;
        QTest::newRow("Nordic") << u"ørsted"_s << u"Ørsted"_s << u"Ørsted"_s;
        QTest::newRow("Greek, per character") << u"ΣΟΦΙΑ"_s << u"Σοφια"_s << u"Σοφια"_s;
        QTest::newRow("sharp s keeps its length") << u"STRAßE"_s << u"Straße"_s << u"Straße"_s;
        QTest::newRow("beyond the basic plane")
            << u"\U00010428\U00010400"_s << u"\U00010400\U00010428"_s << u"\U00010400\U00010428"_s;
    }

    void tidiesNames()
    {
        QFETCH(QString, stored);
        QFETCH(QString, properCase);
        QFETCH(QString, tidied);
        QCOMPARE(ProperCase(stored), properCase);
        QCOMPARE(tidyName(stored), tidied);
    }

    void stripsOnlySpaces() { QCOMPARE(StripSpaces(u" a b\tc\u00a0d  "_s), u"ab\tc\u00a0d"_s); }

    void randomIndexStaysInRange_data()
    {
        QTest::addColumn<int>("n");
        QTest::newRow("one") << 1;
        QTest::newRow("three") << 3;
        QTest::newRow("largest") << std::numeric_limits<int>::max();
    }

    void randomIndexStaysInRange()
    {
        QFETCH(int, n);
        RandomSource random;
        random.seed(3);
        for (int i = 0; i < 10000; ++i) {
            const double index = RandomIndex(random, n);
            QVERIFY(index >= 1 && index <= n);
            QCOMPARE(index, std::floor(index));
        }
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
        QStringList expectedFirsts, expectedLasts;
        for (int i = 0; i < 500; ++i) {
            const int p = int(RandomIndex(replay, int(lasts.size())));
            const int q = int(RandomIndex(replay, int(firsts.size())));
            expectedLasts.append(tidyName(lasts.at(p - 1)));
            expectedFirsts.append(tidyName(firsts.at(q - 1)));
        }
        QCOMPARE(firstColumn(names), expectedFirsts);
        QCOMPARE(lastColumn(names), expectedLasts);
        // Two draws a name and no more: both sources stand at the same place.
        QCOMPARE(random.nextBits(), replay.nextBits());
        // Each name drawn is tidied once for the run.
        QCOMPARE(QSet<QString>(names.firstNames.begin(), names.firstNames.end()).size(),
                 names.firstNames.size());
    }

    void makesNothingBelowOne_data()
    {
        QTest::addColumn<int>("count");
        QTest::newRow("zero") << 0;
        QTest::newRow("negative") << -5;
        QTest::newRow("lowest") << std::numeric_limits<int>::min();
    }

    void makesNothingBelowOne()
    {
        QFETCH(int, count);
        const QStringList pane{u"a"_s};
        RandomSource random;
        random.seed(1);
        RandomSource untouched = random;
        int updates = 0;
        const GeneratedNames names =
            NameGenerator(pane, pane, random).generate(count, [&](int) { ++updates; });
        QVERIFY(names.rows.empty());
        QCOMPARE(updates, 0);
        QCOMPARE(random.nextBits(), untouched.nextBits());
    }

    void oddPanesGiveOddRows_data()
    {
        QTest::addColumn<QStringList>("firsts");
        QTest::addColumn<QStringList>("lasts");
        QTest::addColumn<QString>("first");
        QTest::addColumn<QString>("last");

        QTest::newRow("one item each")
            << QStringList{u"zOE"_s} << QStringList{u"QUILL"_s} << u"Zoe"_s << u"Quill"_s;
        QTest::newRow("spaces only give an empty name")
            << QStringList{u"   "_s} << QStringList{u"  mac  lean "_s} << QString() << u"Maclean"_s;
    }

    void oddPanesGiveOddRows()
    {
        QFETCH(QStringList, firsts);
        QFETCH(QStringList, lasts);
        QFETCH(QString, first);
        QFETCH(QString, last);
        RandomSource random;
        const GeneratedNames names = NameGenerator(firsts, lasts, random).generate(50);
        QCOMPARE(firstColumn(names), QStringList(50, first));
        QCOMPARE(lastColumn(names), QStringList(50, last));
    }

    void progressFollowsTheRun_data()
    {
        QTest::addColumn<int>("count");
        QTest::addColumn<QList<int>>("values");
        QTest::newRow("one") << 1 << QList<int>{100};
        QTest::newRow("three") << 3 << QList<int>{33, 67, 100};
        QTest::newRow("eight, halves to even") << 8 << QList<int>{12, 25, 38, 50, 62, 75, 88, 100};
    }

    void progressFollowsTheRun()
    {
        QFETCH(int, count);
        QFETCH(QList<int>, values);
        const QStringList pane{u"a"_s, u"b"_s};
        RandomSource random;
        QList<int> seen;
        NameGenerator(pane, pane, random).generate(count, [&](int v) { seen.append(v); });
        QCOMPARE(seen, values);
    }

    void progressOnALongRunShowsEachValueOnce()
    {
        const QStringList pane{u"a"_s, u"b"_s};
        RandomSource random;
        QList<int> seen;
        NameGenerator(pane, pane, random).generate(123457, [&](int v) { seen.append(v); });
        QList<int> everyValue;
        for (int v = 0; v <= 100; ++v)
            everyValue.append(v);
        QCOMPARE(seen, everyValue);
    }

    void drawsAreFair_data()
    {
        QTest::addColumn<int>("items");
        QTest::newRow("two") << 2;
        QTest::newRow("seven") << 7;
        QTest::newRow("ninety-seven") << 97;
    }

    void drawsAreFair()
    {
        QFETCH(int, items);
        QStringList pane;
        for (int i = 0; i < items; ++i)
            pane.append(u"Name"_s + QString::number(i));
        constexpr int Names = 400000;
        RandomSource random;
        random.seed(2024);
        const GeneratedNames names = NameGenerator(pane, pane, random).generate(Names);

        const double share = 1.0 / items;
        const double sigma = std::sqrt(Names * share * (1 - share));
        for (const QStringList& column : {firstColumn(names), lastColumn(names)}) {
            QHash<QString, int> counts;
            for (const QString& name : column)
                ++counts[name];
            QCOMPARE(counts.size(), items);
            for (auto it = counts.cbegin(); it != counts.cend(); ++it) {
                QVERIFY2(std::abs(it.value() - Names * share) < 5 * sigma,
                         qPrintable(it.key() + u" drawn "_s + QString::number(it.value())));
            }
        }
    }

    void modelShowsAndReplacesRuns()
    {
        ResultsModel model;
        QCOMPARE(model.columnCount(), 0);
        QSignalSpy columns(&model, &QAbstractItemModel::columnsInserted);
        model.addColumn(u"First Names"_s);
        model.addColumn(u"Last Names"_s);
        QCOMPARE(columns.size(), 2);
        QCOMPARE(model.headerData(1, Qt::Horizontal, Qt::DisplayRole).toString(), u"Last Names"_s);

        QSignalSpy resets(&model, &QAbstractItemModel::modelReset);
        model.setRows({{u"Ann"_s, u"Bo"_s}, {u"Lee"_s}, {{0, 0}, {1, 0}, {0, 0}}});
        QCOMPARE(resets.size(), 1);
        const ResultRows& rows = model;
        QCOMPARE(rows.rowCount(), 3);
        QCOMPARE(model.rowCount(QModelIndex()), 3);
        QCOMPARE(rows.firstName(1), u"Bo"_s);
        QCOMPARE(rows.lastName(2), u"Lee"_s);
        QCOMPARE(model.index(1, 0).data().toString(), u"Bo"_s);
        QCOMPARE(model.index(1, 1).data().toString(), u"Lee"_s);
        QCOMPARE(rows.firstName(3), QString());

        model.clear();
        QCOMPARE(rows.rowCount(), 0);
        QCOMPARE(model.columnCount(), 2);
    }

    void editingAFirstNameTouchesThatRowOnly()
    {
        ResultsModel model;
        model.addColumn(u"First Names"_s);
        model.addColumn(u"Last Names"_s);
        model.setRows({{u"Ann"_s}, {u"Lee"_s}, {{0, 0}, {0, 0}}});
        QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);

        QVERIFY(model.flags(model.index(0, 0)).testFlag(Qt::ItemIsEditable));
        QVERIFY(!model.flags(model.index(0, 1)).testFlag(Qt::ItemIsEditable));
        QVERIFY(model.setData(model.index(1, 0), u"Annabel"_s, Qt::EditRole));
        QVERIFY(!model.setData(model.index(1, 1), u"Smith"_s, Qt::EditRole));
        QCOMPARE(changed.size(), 1);
        QCOMPARE(model.firstName(0), u"Ann"_s);
        QCOMPARE(model.firstName(1), u"Annabel"_s);
        QCOMPARE(model.lastName(1), u"Lee"_s);

        // A new run forgets the edits of the last.
        model.setRows({{u"Ann"_s}, {u"Lee"_s}, {{0, 0}, {0, 0}}});
        QCOMPARE(model.firstName(1), u"Ann"_s);
    }
};

QTEST_GUILESS_MAIN(TestGeneration)
#include "tst_generation.moc"
