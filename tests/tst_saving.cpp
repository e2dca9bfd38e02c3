// Saving the results list: the text file's bytes and its safe replacement,
// the workbook as an independent reader sees it, and the reports a user gets
// when something fails.
#include "base/errorreport.h"
#include "results/resultrows.h"
#include "results/resultsmodel.h"
#include "app/resultssaver.h"
#include "results/textfile.h"
#include "support/fakedialogs.h"
#include "support/fakeplatform.h"
#include "support/workbook.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

#include <csignal>
#include <sys/resource.h>

using namespace Qt::StringLiterals;

namespace {

using Names = QList<std::pair<QString, QString>>;

struct ListRows : ResultRows {
    explicit ListRows(Names rows)
        : names(std::move(rows))
    {
    }
    int rowCount() const override { return int(names.size()); }
    QString firstName(int row) const override { return names.at(row).first; }
    QString lastName(int row) const override { return names.at(row).second; }
    Names names;
};

const Names AnnBob{{u"Ann"_s, u"Lee"_s}, {u"Bob"_s, u"Stone"_s}};
const Names Foreign{{u"Zoë"_s, u"Łukasiewicz"_s}, {u"山田"_s, u"太郎"_s}};

QByteArray readAll(const QString& path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray("<unreadable>");
}

QStringList entries(const QString& folder)
{
    return QDir(folder).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot);
}

// The one message shown is this button's error report for the step at line
// (its title and icon are the error report's own concern).
void verifyOneReport(const FakeDialogs& dialogs, int line, const QString& start)
{
    QCOMPARE(dialogs.messages().size(), 1);
    const FakeDialogs::Shown& report = dialogs.shown.last();
    const QString description = report.text.section(u"\r\n"_s, 0, 0);
    QVERIFY2(description.startsWith(start), qPrintable(report.text));
    QCOMPARE(report.text, errorReportText(description, u"in Tessmark.Form2.PushButton2_Click "_s,
                                          line, ClosingLine::Long));
}

} // namespace

class TestSaving : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // The save dialog's answer is a name in a folder that holds old.txt and
    // sub/, or empty for a cancel. Tests run as root here, which writes
    // through permission bits, so the failures are ones that hit root too;
    // a file size limit of 4 KB makes a long list fail as on a full disk.
    void textFile_data()
    {
        QTest::addColumn<Names>("names");
        QTest::addColumn<QString>("answer");
        QTest::addColumn<QByteArray>("bytes"); // of the answered file; old.txt holds "old"
        QTest::addColumn<QStringList>("files");
        QTest::addColumn<bool>("fails");

        const QStringList kept{u"old.txt"_s, u"sub"_s}, added = QStringList{u"names.txt"_s} + kept;
        const QByteArray annBob("Ann Lee\r\nBob Stone\r\n"), none;
        const QByteArray foreign = u"Zoë Łukasiewicz\r\n山田 太郎\r\n"_s.toUtf8();
        const Names many(2000, {u"First"_s, u"Last"_s}); // far more than 4 KB
        QTest::newRow("CR LF") << AnnBob << u"names.txt"_s << annBob << added << false;
        QTest::newRow("empty list") << Names{} << u"names.txt"_s << none << added << false;
        QTest::newRow("UTF-8, no BOM") << Foreign << u"names.txt"_s << foreign << added << false;
        QTest::newRow("replaced, no question") << AnnBob << u"old.txt"_s << annBob << kept << false;
        QTest::newRow("used as typed")
            << AnnBob << u"names"_s << annBob << QStringList{u"names"_s} + kept << false;
        QTest::newRow("cancel") << AnnBob << QString() << none << kept << false;
        QTest::newRow("disk full") << many << u"old.txt"_s << QByteArray("old") << kept << true;
        QTest::newRow("a folder") << AnnBob << u"sub"_s << none << kept << true;
        QTest::newRow("no such folder") << AnnBob << u"no/names.txt"_s << none << kept << true;
    }

    void textFile()
    {
        QFETCH(Names, names);
        QFETCH(QString, answer);
        QFETCH(QByteArray, bytes);
        QFETCH(bool, fails);
        QTemporaryDir dir;
        QDir(dir.path()).mkdir(u"sub"_s);
        QFile old(dir.filePath(u"old.txt"_s));
        QVERIFY(old.open(QIODevice::WriteOnly) && old.write("old") == 3);
        old.close();
        FakeDialogs dialogs;
        FakeShell shell;
        dialogs.answerSave(answer.isEmpty() ? QString() : dir.filePath(answer)); // empty: cancel

        const rlimit small{4096, RLIM_INFINITY}, unlimited{RLIM_INFINITY, RLIM_INFINITY};
        std::signal(SIGXFSZ, SIG_IGN);
        setrlimit(RLIMIT_FSIZE, &small);
        ResultsSaver(dialogs, shell, dir.path()).save(OutputChoice::TextFile, ListRows(names));
        setrlimit(RLIMIT_FSIZE, &unlimited);

        QTEST(entries(dir.path()), "files"); // no temporary file left behind
        if (fails)
            verifyOneReport(dialogs, 30, u"The file "_s + dir.filePath(answer) + u" could not"_s);
        else if (!answer.isEmpty())
            QCOMPARE(readAll(dir.filePath(answer)), bytes);
        QCOMPARE(readAll(old.fileName()), answer == u"old.txt"_s ? bytes : QByteArray("old"));
        // The save dialog, and nothing after it but a failure's report.
        QCOMPARE(dialogs.shown.size(), fails ? 2 : 1);
    }

    // Rows kept as indices into tables are written from names encoded once
    // per table; other rows name by name. Both give the same bytes in every
    // layout, quoting included.
    void layoutsOfTheRows_data()
    {
        QTest::addColumn<QByteArray (*)(const ResultRows&)>("layout");
        QTest::addColumn<QByteArray>("bytes");
        QTest::newRow("text")
            << &resultsText << u"Zoë Lee\r\nAnn \"Jr\"\r\nZoë \"Jr\"\r\nAnn, B Lee\r\n"_s.toUtf8();
        QTest::newRow("lines") << &resultsLines
                               << u"Zoë Lee\nAnn \"Jr\"\nZoë \"Jr\"\nAnn, B Lee\n"_s.toUtf8();
        QTest::newRow("csv") << &resultsCsv
                             << u"first_name,last_name\r\nZoë,Lee\r\nAnn,\"\"\"Jr\"\"\"\r\n"
                                u"Zoë,\"\"\"Jr\"\"\"\r\n\"Ann, B\",Lee\r\n"_s.toUtf8();
    }

    void layoutsOfTheRows()
    {
        using Layout = QByteArray (*)(const ResultRows&);
        QFETCH(Layout, layout);
        QFETCH(QByteArray, bytes);
        GeneratedNames generated;
        generated.firstNames = QStringList{u"Zoë"_s, u"Ann"_s, u"Ann, B"_s};
        generated.lastNames = QStringList{u"Lee"_s, u"\"Jr\""_s};
        generated.rows = {{0, 0}, {1, 1}, {0, 1}, {2, 0}};
        ResultsModel indexed;
        indexed.setRows(generated);
        QVERIFY(indexed.indexedNames());
        QCOMPARE(layout(indexed), bytes);
        const Names byName{{u"Zoë"_s, u"Lee"_s},
                           {u"Ann"_s, u"\"Jr\""_s},
                           {u"Zoë"_s, u"\"Jr\""_s},
                           {u"Ann, B"_s, u"Lee"_s}};
        QCOMPARE(layout(ListRows(byName)), bytes);
    }

    // A field is quoted, its quotes doubled, where a CSV reader would split
    // it: at a comma, a quote, and either half of a line end. Rows kept as
    // indices and rows kept by name alike.
    void csvQuotesWhatWouldSplitAField_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QByteArray>("field");
        QTest::newRow("plain") << u"Ann"_s << QByteArray("Ann");
        QTest::newRow("comma") << u"Ann,Bo"_s << QByteArray("\"Ann,Bo\"");
        QTest::newRow("quote") << u"A\"nn"_s << QByteArray("\"A\"\"nn\"");
        QTest::newRow("CR") << u"Ann\rBo"_s << QByteArray("\"Ann\rBo\"");
        QTest::newRow("LF") << u"Ann\nBo"_s << QByteArray("\"Ann\nBo\"");
        QTest::newRow("CR LF") << u"Ann\r\nBo"_s << QByteArray("\"Ann\r\nBo\"");
    }

    void csvQuotesWhatWouldSplitAField()
    {
        QFETCH(QString, name);
        QFETCH(QByteArray, field);
        GeneratedNames generated;
        generated.firstNames = QStringList{name};
        generated.lastNames = QStringList{name};
        generated.rows = {{0, 0}};
        ResultsModel indexed;
        indexed.setRows(generated);
        const QByteArray csv = "first_name,last_name\r\n" + field + ',' + field + "\r\n";
        QCOMPARE(resultsCsv(indexed), csv);
        QCOMPARE(resultsCsv(ListRows({{name, name}})), csv);
    }

    void workbook_data()
    {
        QTest::addColumn<OutputChoice>("choice");
        QTest::addColumn<Names>("names");
        QTest::addColumn<QString>("cells");

        const auto two = OutputChoice::SpreadsheetTwoCells, one = OutputChoice::SpreadsheetOneCell;
        // Names that look like a number, a truth value and formulas stay text.
        const Names rows{{u"Ann"_s, u"Lee"_s}, {u"007"_s, u"TRUE"_s}, {u"=1+2"_s, u"1e5"_s}};
        QTest::newRow("2 cells") << two << rows << u"A1 Ann,B1 Lee,A2 007,B2 TRUE,A3 =1+2,B3 1e5"_s;
        QTest::newRow("1 cell") << one << rows << u"A1 Ann Lee,A2 007 TRUE,A3 =1+2 1e5"_s;
        QTest::newRow("1 cell: UTF-8") << one << Foreign << u"A1 Zoë Łukasiewicz,A2 山田 太郎"_s;
    }

    void workbook()
    {
        SKIP_WITHOUT_WORKBOOK_READER();
        QFETCH(OutputChoice, choice);
        QFETCH(Names, names);
        QTemporaryDir cache, noCache;
        FakeDialogs dialogs;
        FakeShell shell;
        ResultsSaver(dialogs, shell, cache.path()).save(choice, ListRows(names));

        // The one file in the cache folder, handed to the desktop.
        QCOMPARE(shell.documents, QStringList{cache.filePath(entries(cache.path()).join(u'|'))});
        QTEST(readWorkbook(shell.documents.value(0)), "cells");

        // Without a program for workbooks on the desktop: one report, and
        // the workbook made for it is not left behind.
        shell.hasDocumentProgram = false;
        ResultsSaver(dialogs, shell, noCache.path()).save(choice, ListRows(names));
        verifyOneReport(dialogs, 140, u"There is no program"_s);
        QCOMPARE(entries(noCache.path()), QStringList());
    }
};

QTEST_GUILESS_MAIN(TestSaving)
#include "tst_saving.moc"
