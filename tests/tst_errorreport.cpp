// The error report and the trap that shows it.
#include "base/errorreport.h"
#include "base/failure.h"
#include "base/trap.h"
#include "names/namelists.h"
#include "support/fakedialogs.h"

#include <QTest>

using namespace Qt::StringLiterals;

class TestErrorReport : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void reportText_data()
    {
        QTest::addColumn<QString>("description");
        QTest::addColumn<QString>("location");
        QTest::addColumn<int>("line");
        QTest::addColumn<ClosingLine>("closing");
        QTest::addColumn<QString>("expected");

        QTest::newRow("long closing line")
            << u"Disk full"_s << u"in Tessmark.Form1.PushButton2_Click "_s << 30
            << ClosingLine::Long
            << u"Disk full\r\nin Tessmark.Form1.PushButton2_Click at line 30\r\r"
               "Please email screenshot of this message to support@quillane.org"_s;
        QTest::newRow("short closing line")
            << u"Overflow"_s << u"in Tessmark.Form1.PushButton1_Click "_s << 120
            << ClosingLine::Short
            << u"Overflow\r\nin Tessmark.Form1.PushButton1_Click at line 120\r\r"
               "Please email support@quillane.org"_s;
        QTest::newRow("empty description gives an empty first line")
            << QString() << u"in Tessmark.Main.FileToListview "_s << 5 << ClosingLine::Long
            << u"\r\nin Tessmark.Main.FileToListview at line 5\r\r"
               "Please email screenshot of this message to support@quillane.org"_s;
    }

    void reportText()
    {
        QFETCH(QString, description);
        QFETCH(QString, location);
        QFETCH(int, line);
        QFETCH(ClosingLine, closing);
        QFETCH(QString, expected);
        FakeDialogs dialogs;
        ShowErrorReport(dialogs, description, location, line, closing);
        QCOMPARE(dialogs.messages(), QStringList{expected});
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
        trap(50, [&] { ran << u"50"_s; });
        QCOMPARE(trap.failures(), 3);
        QCOMPARE(ran, (QStringList{u"10"_s, u"50"_s}));
        QCOMPARE(turns, 1);
        const auto report = [](const QString& description, int line) {
            return errorReportText(description, u"in Tessmark.Form1.PushButton8_Click "_s, line,
                                   ClosingLine::Long);
        };
        QCOMPARE(dialogs.messages(), (QStringList{report(u"first"_s, 20), report(u"second"_s, 30),
                                                  report(u"/nonexistent/folder/names.mdb: unable to open database file"_s, 40)}));
    }
};

QTEST_GUILESS_MAIN(TestErrorReport)
#include "tst_errorreport.moc"
