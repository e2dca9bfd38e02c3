// The error report and the trap that shows it, and control characters
// escaped in the messages of both front ends.
#include "base/errorreport.h"
#include "base/failure.h"
#include "base/trap.h"
#include "names/namelists.h"
#include "support/fakedialogs.h"

#include <QProcess>
#include <QTest>

using namespace Qt::StringLiterals;

class TestErrorReport : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // What failed, where and at which step, and whom to tell; the short
    // closing line leaves the screenshot out. A name read from a file must
    // not drive the terminal or the box: control characters are escaped.
    void reportText()
    {
        FakeDialogs dialogs;
        const QString description =
            u"Bad\x1b[2J\x1b]0;title\x07name\tx\ry\x7f\u009b\u2028\u2029 A\u0308\nNext line"_s;
        for (const ClosingLine closing : {ClosingLine::Long, ClosingLine::Short})
            ShowErrorReport(dialogs, description, u"in Tessmark.Form1.PushButton2_Click "_s, 30,
                            closing);
        const QString start =
            u"Bad\\x1b[2J\\x1b]0;title\\x07name\\tx\\ry\\x7f\\x9b\\u2028\\u2029 A\u0308\nNext line"
            u"\r\nin Tessmark.Form1.PushButton2_Click at line 30\r\r"_s;
        QCOMPARE(dialogs.messages(),
                 (QStringList{start + u"Please email screenshot of this message to "_s
                                  + u"support@quillane.org"_s,
                              start + u"Please email support@quillane.org"_s}));
        QCOMPARE(dialogs.shown[0].title, u"Application Error"_s);
        QCOMPARE(dialogs.shown[0].icon, MessageIcon::Exclamation);
    }

    // Each failing step of a handler is reported under the handler's location
    // and the handler goes on with its next step. A step ends at its first
    // failure, so a loop that keeps failing is reported once. RefreshLists
    // has no trap of its own: its failure is the calling step's.
    void aTrapReportsEachFailingStepAndGoesOn()
    {
        FakeDialogs dialogs;
        NameLists lists(u"/nonexistent/folder/names.mdb"_s);
        QStringList ran;
        int turns = 0;
        Trap trap(dialogs, u"in Tessmark.Form1.PushButton8_Click "_s, ClosingLine::Long);
        trap(10, [&] { ran << u"10"_s; });
        trap(20, [&] { throw Failure(u"first"_s); });
        trap(30, [&] {
            while (++turns < 1000)
                throw std::runtime_error("second");
        });
        trap(40, [&] { lists.RefreshLists(ListChoice{}); });
        trap(41, [&] { throw std::bad_alloc(); });
        trap(42, [&] { throw 42; });
        trap(50, [&] { ran << u"50"_s; });
        QCOMPARE(trap.failures(), 5);
        QCOMPARE(ran, (QStringList{u"10"_s, u"50"_s}));
        QCOMPARE(turns, 1);
        const auto report = [](const QString& description, int line) {
            return errorReportText(description, u"in Tessmark.Form1.PushButton8_Click "_s, line,
                                   ClosingLine::Long);
        };
        QCOMPARE(dialogs.messages(),
                 (QStringList{
                     report(u"first"_s, 20), report(u"second"_s, 30),
                     report(u"/nonexistent/folder/names.mdb: unable to open database file"_s, 40),
                     report(u"Out of memory"_s, 41), report(u"Unknown error"_s, 42)}));
    }

    void cliComplaintsShowControlCharactersEscaped_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<QString>("complaint");
        QTest::newRow("usage error")
            << QStringList{u"--x\x1b[2J\ty"_s}
            << u"quillane-cli: Unknown option '--x\\x1b[2J\\ty'. Try 'quillane-cli --help'.\n"_s;
        QTest::newRow("failure naming a file")
            << QStringList{u"--database"_s, u"/nonexistent/\x1b[31mred\u009b/names.mdb"_s,
                           u"names"_s, u"first"_s}
            << u"quillane-cli: /nonexistent/\\x1b[31mred\\x9b/names.mdb: unable to open database "
               "file\n"_s;
    }

    // What a terminal gets on standard error.
    void cliComplaintsShowControlCharactersEscaped()
    {
        QFETCH(QStringList, arguments);
        QFETCH(QString, complaint);
        QProcess cli;
        cli.start(QStringLiteral(QUILLANE_CLI), arguments);
        QVERIFY(cli.waitForFinished(60000));
        QCOMPARE(QString::fromUtf8(cli.readAllStandardError()), complaint);
        QVERIFY(cli.exitCode() != 0);
    }
};

QTEST_GUILESS_MAIN(TestErrorReport)
#include "tst_errorreport.moc"
