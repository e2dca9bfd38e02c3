// The error report and the trap that shows it.
#include "app/errorreport.h"
#include "app/failure.h"
#include "app/trap.h"
#include "names/namelists.h"
#include "support/fakedialogs.h"
#include "support/fakepointer.h"

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

        QCOMPARE(errorReportText(description, location, line, closing), expected);

        FakeDialogs dialogs;
        ShowErrorReport(dialogs, description, location, line, closing);
        QCOMPARE(dialogs.shown.size(), 1);
        QCOMPARE(dialogs.shown[0].title, u"Application Error"_s);
        QCOMPARE(dialogs.shown[0].icon, MessageIcon::Exclamation);
        QCOMPARE(dialogs.shown[0].text, expected);
    }

    void eachFailingStepIsReportedAndTheHandlerGoesOn()
    {
        FakeDialogs dialogs;
        QStringList ran;
        {
            Trap trap(dialogs, u"in Tessmark.Form1.PushButton8_Click "_s, ClosingLine::Long);
            trap(10, [&] { ran << u"10"_s; });
            trap(20, [&] { throw Failure(u"first"_s); });
            trap(30, [&] { ran << u"30"_s; });
            trap(40, [&] { throw std::runtime_error("second"); });
            trap(50, [&] { ran << u"50"_s; });
            QCOMPARE(trap.failures(), 2);
        }
        QCOMPARE(ran, (QStringList{u"10"_s, u"30"_s, u"50"_s}));
        const QStringList messages = dialogs.messages();
        QCOMPARE(messages.size(), 2);
        QVERIFY(messages[0].startsWith(u"first\r\nin Tessmark.Form1.PushButton8_Click at line 20"_s));
        QVERIFY(messages[1].startsWith(u"second\r\nin Tessmark.Form1.PushButton8_Click at line 40"_s));
    }

    void failureInsideACalledRoutineIsTheCallingStepsFailure()
    {
        // RefreshLists has no trap of its own: its failure is reported under
        // the handler that called it, and the handler then carries on.
        FakeDialogs dialogs;
        FakePointer pointer;
        NameLists lists(u"/nonexistent/folder/names.mdb"_s, pointer);
        bool after = false;
        Trap trap(dialogs, u"in Tessmark.Form1.PushButton5_Click "_s, ClosingLine::Long);
        trap(60, [&] { lists.RefreshLists(ListChoice{}); });
        trap(70, [&] { after = true; });
        QVERIFY(after);
        QCOMPARE(dialogs.messages(),
                 QStringList{u"unable to open database file\r\n"
                             "in Tessmark.Form1.PushButton5_Click at line 60\r\r"
                             "Please email screenshot of this message to support@quillane.org"_s});
    }

    void aLoopThatKeepsFailingIsReportedOnce()
    {
        FakeDialogs dialogs;
        int turns = 0;
        Trap trap(dialogs, u"in Tessmark.Form2.PushButton2_Click "_s, ClosingLine::Long);
        trap(30, [&] {
            for (int row = 0; row < 1000; ++row) {
                ++turns;
                throw Failure(u"no spreadsheet"_s);
            }
        });
        QCOMPARE(turns, 1);
        QCOMPARE(dialogs.messages().size(), 1);
    }
};

QTEST_GUILESS_MAIN(TestErrorReport)
#include "tst_errorreport.moc"
