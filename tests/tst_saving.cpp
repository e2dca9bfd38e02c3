// Saving the results list: the text file's bytes and its safe replacement,
// the workbook as an independent reader sees it, and the reports a user gets
// when something fails.
#include "app/errorreport.h"
#include "app/shell.h"
#include "results/resultrows.h"
#include "results/resultssaver.h"
#include "results/textfile.h"
#include "support/fakedialogs.h"
#include "support/fakeplatform.h"

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>
#include <QTest>

#include <csignal>
#include <sys/resource.h>
#include <unistd.h>

using namespace Qt::StringLiterals;

namespace {

using Names = QList<std::pair<QString, QString>>;

class ListRows : public ResultRows {
public:
    explicit ListRows(Names names)
        : m_names(std::move(names)) {}
    int rowCount() const override { return int(m_names.size()); }
    QString firstName(int row) const override { return m_names.at(row).first; }
    QString lastName(int row) const override { return m_names.at(row).second; }

private:
    Names m_names;
};

const QString Location = u"in Tessmark.Form2.PushButton2_Click "_s;

QByteArray readAll(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray("<unreadable>");
}

void writeFile(const QString& path, const QByteArray& bytes) {
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly));
    QCOMPARE(file.write(bytes), bytes.size());
}

QStringList entries(const QString& folder) {
    return QDir(folder).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot,
                                  QDir::Name);
}

// Every filled cell of every sheet, read by openpyxl: "sheet!A1 type value".
QStringList readWorkbook(const QString& path) {
    static const QString script = uR"(
import json, sys, openpyxl
book = openpyxl.load_workbook(sys.argv[1])
cells = []
for sheet in book.worksheets:
    for row in sheet.iter_rows():
        for cell in row:
            if cell.value is not None:
                cells.append("%s!%s %s %s" % (sheet.title, cell.coordinate, cell.data_type, cell.value))
print(json.dumps(cells))
)"_s;
    QProcess python;
    python.start(u"/usr/bin/python3"_s, {u"-c"_s, script, path});
    if (!python.waitForFinished(60000) || python.exitCode() != 0)
        return {u"reader failed: "_s + QString::fromUtf8(python.readAllStandardError())};
    QStringList cells;
    for (const QJsonValue& cell : QJsonDocument::fromJson(python.readAllStandardOutput()).array())
        cells.append(cell.toString());
    return cells;
}

} // namespace

class TestSaving : public QObject {
    Q_OBJECT

    QTemporaryDir m_dir;

    QString folder(const QString& name) {
        const QString path = m_dir.filePath(name);
        QDir(path).removeRecursively();
        QDir().mkpath(path);
        return path;
    }

    // The one message shown must be the error report of this button.
    static void verifyOneReport(const FakeDialogs& dialogs, int line, const QString& start) {
        const QStringList messages = dialogs.messages();
        QCOMPARE(messages.size(), 1);
        const Shown report = *std::find_if(dialogs.shown.begin(), dialogs.shown.end(), [](auto& s) {
            return s.kind == FakeDialogs::Kind::Message;
        });
        QCOMPARE(report.title, u"Application Error"_s);
        QCOMPARE(report.icon, MessageIcon::Exclamation);
        const QString description = messages[0].section(u"\r\n"_s, 0, 0);
        QVERIFY2(description.startsWith(start), qPrintable(messages[0]));
        QCOMPARE(messages[0], errorReportText(description, Location, line, ClosingLine::Long));
    }
    using Shown = FakeDialogs::Shown;

private Q_SLOTS:
    void textFile_data() {
        QTest::addColumn<Names>("names");
        QTest::addColumn<QByteArray>("bytes");

        QTest::newRow("two rows, one space, CR LF each")
            << Names{{u"Ann"_s, u"Lee"_s}, {u"Bob"_s, u"Stone"_s}}
            << QByteArray("Ann Lee\r\nBob Stone\r\n");
        QTest::newRow("empty list gives an empty file") << Names{} << QByteArray();
        QTest::newRow("non-ASCII names in UTF-8, no byte-order mark")
            << Names{{u"Zoë"_s, u"Łukasiewicz"_s}, {u"山田"_s, u"太郎"_s}}
            << QByteArray("Zo\xc3\xab \xc5\x81ukasiewicz\r\n"
                          "\xe5\xb1\xb1\xe7\x94\xb0 \xe5\xa4\xaa\xe9\x83\x8e\r\n");
        QTest::newRow("names written as they are")
            << Names{{u"0012"_s, u"TRUE"_s}, {u"=SUM(A1)"_s, u" O'Neil"_s}, {QString(), u"Lee"_s}}
            << QByteArray("0012 TRUE\r\n=SUM(A1)  O'Neil\r\n Lee\r\n");
    }

    void textFile() {
        QFETCH(Names, names);
        QFETCH(QByteArray, bytes);
        const QString dir = folder(u"text"_s);
        const QString path = dir + u"/names.txt"_s;
        FakeDialogs dialogs;
        FakeShell shell;
        dialogs.answerSave(path);

        ResultsSaver(dialogs, shell, folder(u"cache"_s))
            .save(OutputChoice::TextFile, ListRows(names));

        QCOMPARE(readAll(path), bytes);
        QCOMPARE(entries(dir), QStringList{u"names.txt"_s});
        QCOMPARE(dialogs.shown.size(), 1);
        QCOMPARE(dialogs.shown[0].kind, FakeDialogs::Kind::Save);
        QCOMPARE(dialogs.shown[0].title, u"Save File As"_s);
        QCOMPARE(dialogs.shown[0].filter, u"Text Files (*.txt);;All Files (*)"_s);
        QVERIFY(shell.documents.isEmpty());
    }

    void whatTheDialogAnswers_data() {
        QTest::addColumn<QString>("answer"); // a name in the folder; empty: cancel
        QTest::addColumn<QStringList>("files");

        QTest::newRow("existing file replaced without a question")
            << u"old.txt"_s << QStringList{u"old.txt"_s};
        QTest::newRow("name without an extension used as typed")
            << u"results"_s << QStringList{u"old.txt"_s, u"results"_s};
        QTest::newRow("cancel writes nothing") << QString() << QStringList{u"old.txt"_s};
    }

    void whatTheDialogAnswers() {
        QFETCH(QString, answer);
        QFETCH(QStringList, files);
        const QString dir = folder(u"answers"_s);
        const QByteArray old(5000, 'x');
        writeFile(dir + u"/old.txt"_s, old);
        FakeDialogs dialogs;
        FakeShell shell;
        if (!answer.isEmpty())
            dialogs.answerSave(dir + u'/' + answer);

        ResultsSaver(dialogs, shell, folder(u"cache"_s))
            .save(OutputChoice::TextFile, ListRows({{u"Ann"_s, u"Lee"_s}}));

        QCOMPARE(entries(dir), files);
        QCOMPARE(dialogs.shown.size(), 1); // the dialog and nothing after it
        QCOMPARE(readAll(dir + u"/old.txt"_s), answer == u"old.txt"_s ? "Ann Lee\r\n" : old);
        if (!answer.isEmpty())
            QCOMPARE(readAll(dir + u'/' + answer), QByteArray("Ann Lee\r\n"));
    }

    // Tests run as root here, which writes through permission bits; the
    // cases that fail for root too stand in for a read-only file or folder,
    // and a file size limit makes the write itself fail as a full disk does.
    void failedWriteKeepsTheFileAndReportsOnce_data() {
        QTest::addColumn<QString>("kind");
        QTest::newRow("file size limit reached while writing") << u"full"_s;
        QTest::newRow("name of a folder") << u"folder"_s;
        QTest::newRow("folder that does not exist") << u"missing"_s;
        QTest::newRow("folder that is a file") << u"file-as-folder"_s;
        QTest::newRow("read-only file") << u"read-only file"_s;
        QTest::newRow("read-only folder") << u"read-only folder"_s;
    }

    void failedWriteKeepsTheFileAndReportsOnce() {
        QFETCH(QString, kind);
        if (kind.startsWith(u"read-only"_s) && geteuid() == 0)
            QSKIP("root writes through permission bits");

        const QString dir = folder(u"failing"_s);
        const QByteArray old("Old Names\r\nKept Safe\r\n");
        writeFile(dir + u"/names.txt"_s, old);
        writeFile(dir + u"/plain"_s, "a file");
        QDir(dir).mkdir(u"sub"_s);
        QString path = dir + u"/names.txt"_s;
        if (kind == u"folder"_s)
            path = dir + u"/sub"_s;
        else if (kind == u"missing"_s)
            path = dir + u"/nowhere/names.txt"_s;
        else if (kind == u"file-as-folder"_s)
            path = dir + u"/plain/names.txt"_s;
        else if (kind == u"read-only file"_s)
            QFile::setPermissions(path, QFile::ReadOwner);
        else if (kind == u"read-only folder"_s)
            QFile::setPermissions(dir, QFile::ReadOwner | QFile::ExeOwner);
        const QStringList before = entries(dir);

        Names names;
        for (int i = 0; i < 2000; ++i)
            names.append({u"First%1"_s.arg(i), u"Last%1"_s.arg(i)});
        FakeDialogs dialogs;
        FakeShell shell;
        dialogs.answerSave(path);
        {
            // Writes past 4 KB fail as on a full disk, for root as well.
            rlimit saved{};
            getrlimit(RLIMIT_FSIZE, &saved);
            const auto oldHandler = std::signal(SIGXFSZ, SIG_IGN);
            if (kind == u"full"_s) {
                rlimit small = saved;
                small.rlim_cur = 4096;
                setrlimit(RLIMIT_FSIZE, &small);
            }
            ResultsSaver(dialogs, shell, folder(u"cache"_s))
                .save(OutputChoice::TextFile, ListRows(names));
            setrlimit(RLIMIT_FSIZE, &saved);
            std::signal(SIGXFSZ, oldHandler);
        }
        QFile::setPermissions(dir, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);

        verifyOneReport(dialogs, 30, u"The file "_s + path + u" could not be saved: "_s);
        QCOMPARE(readAll(dir + u"/names.txt"_s), old);
        QCOMPARE(entries(dir), before); // no temporary file left behind
    }

    void workbook_data() {
        QTest::addColumn<OutputChoice>("choice");
        QTest::addColumn<Names>("names");
        QTest::addColumn<QStringList>("cells");

        const Names three{{u"Ann"_s, u"Lee"_s}, {u"Bob"_s, u"Stone"_s}, {u"Cy"_s, u"Moss"_s}};
        QTest::newRow("2 cells: three rows fill A1:B3")
            << OutputChoice::ExcelTwoCells << three
            << QStringList{u"Sheet1!A1 s Ann"_s,   u"Sheet1!B1 s Lee"_s, u"Sheet1!A2 s Bob"_s,
                           u"Sheet1!B2 s Stone"_s, u"Sheet1!A3 s Cy"_s,  u"Sheet1!B3 s Moss"_s};
        QTest::newRow("1 cell: three rows fill A1:A3")
            << OutputChoice::ExcelOneCell << three
            << QStringList{u"Sheet1!A1 s Ann Lee"_s, u"Sheet1!A2 s Bob Stone"_s,
                           u"Sheet1!A3 s Cy Moss"_s};

        const Names lookalikes{{u"0012"_s, u"TRUE"_s}, {u"=SUM(A1)"_s, u"1e5"_s}};
        QTest::newRow("2 cells: numbers, truth values, formulas stay text")
            << OutputChoice::ExcelTwoCells << lookalikes
            << QStringList{u"Sheet1!A1 s 0012"_s, u"Sheet1!B1 s TRUE"_s, u"Sheet1!A2 s =SUM(A1)"_s,
                           u"Sheet1!B2 s 1e5"_s};
        QTest::newRow("1 cell: numbers, truth values, formulas stay text")
            << OutputChoice::ExcelOneCell << Names{{u"=1+2"_s, u"3"_s}, {u"FALSE"_s, u"0"_s}}
            << QStringList{u"Sheet1!A1 s =1+2 3"_s, u"Sheet1!A2 s FALSE 0"_s};

        const Names foreign{{u"Zoë"_s, u"Łukasiewicz"_s}, {u"山田"_s, u"太郎"_s}};
        QTest::newRow("2 cells: non-ASCII names")
            << OutputChoice::ExcelTwoCells << foreign
            << QStringList{u"Sheet1!A1 s Zoë"_s, u"Sheet1!B1 s Łukasiewicz"_s,
                           u"Sheet1!A2 s 山田"_s, u"Sheet1!B2 s 太郎"_s};
        QTest::newRow("1 cell: non-ASCII names")
            << OutputChoice::ExcelOneCell << foreign
            << QStringList{u"Sheet1!A1 s Zoë Łukasiewicz"_s, u"Sheet1!A2 s 山田 太郎"_s};

        QTest::newRow("2 cells: empty list, empty workbook")
            << OutputChoice::ExcelTwoCells << Names{} << QStringList{};
        QTest::newRow("1 cell: empty list, empty workbook")
            << OutputChoice::ExcelOneCell << Names{} << QStringList{};
    }

    void workbook() {
        QFETCH(OutputChoice, choice);
        QFETCH(Names, names);
        QFETCH(QStringList, cells);
        const QString cache = folder(u"cache"_s);
        FakeDialogs dialogs;
        FakeShell shell;

        ResultsSaver(dialogs, shell, cache).save(choice, ListRows(names));

        QVERIFY(dialogs.shown.isEmpty());
        QCOMPARE(shell.documents.size(), 1);
        const QString document = shell.documents[0];
        QCOMPARE(QFileInfo(document).absolutePath(), cache);
        static const QRegularExpression named(
            uR"(^Quillane names \d{4}-\d\d-\d\d \d\d\.\d\d\.\d\d( \(\d+\))?\.xlsx$)"_s);
        QVERIFY2(named.match(QFileInfo(document).fileName()).hasMatch(), qPrintable(document));
        QCOMPARE(entries(cache), QStringList{QFileInfo(document).fileName()});
        QCOMPARE(readWorkbook(document), cells);
    }

    void eachWorkbookGetsANewFile() {
        const QString cache = folder(u"cache"_s);
        FakeDialogs dialogs;
        FakeShell shell;
        ResultsSaver saver(dialogs, shell, cache);
        saver.save(OutputChoice::ExcelTwoCells, ListRows({{u"Ann"_s, u"Lee"_s}}));
        saver.save(OutputChoice::ExcelOneCell, ListRows({{u"Bob"_s, u"Stone"_s}}));

        QVERIFY(dialogs.shown.isEmpty());
        QCOMPARE(shell.documents.size(), 2);
        QVERIFY(shell.documents[0] != shell.documents[1]);
        QCOMPARE(readWorkbook(shell.documents[0]),
                 (QStringList{u"Sheet1!A1 s Ann"_s, u"Sheet1!B1 s Lee"_s}));
        QCOMPARE(readWorkbook(shell.documents[1]), QStringList{u"Sheet1!A1 s Bob Stone"_s});
    }

    void workbookFailureReportsOnceAndLeavesNothing_data() {
        QTest::addColumn<OutputChoice>("choice");
        QTest::addColumn<bool>("desktopProgram");
        QTest::addColumn<int>("line");
        QTest::addColumn<QString>("start");

        QTest::newRow("2 cells, no program for workbooks")
            << OutputChoice::ExcelTwoCells << false << 140 << u"There is no program"_s;
        QTest::newRow("1 cell, no program for workbooks")
            << OutputChoice::ExcelOneCell << false << 140 << u"There is no program"_s;
        // A cell longer than a sheet holds, in every row: one report.
        QTest::newRow("2 cells, every row refused")
            << OutputChoice::ExcelTwoCells << true << 130 << u"String exceeds "_s;
        QTest::newRow("1 cell, every row refused")
            << OutputChoice::ExcelOneCell << true << 130 << u"String exceeds "_s;
    }

    void workbookFailureReportsOnceAndLeavesNothing() {
        QFETCH(OutputChoice, choice);
        QFETCH(bool, desktopProgram);
        QFETCH(int, line);
        QFETCH(QString, start);
        const QString cache = folder(u"cache"_s);
        FakeDialogs dialogs;
        FakeShell shell;
        shell.hasDocumentProgram = desktopProgram;
        Names names;
        const QString first = desktopProgram ? QString(40000, u'a') : u"Ann"_s;
        for (int i = 0; i < 50; ++i)
            names.append({first, u"Lee"_s});

        ResultsSaver(dialogs, shell, cache).save(choice, ListRows(names));

        verifyOneReport(dialogs, line, start);
        QVERIFY(shell.documents.isEmpty());
        QCOMPARE(entries(cache), QStringList{});
    }

    // The real desktop shell, against a desktop of our own making: a fake
    // spreadsheet program that notes the path it was given.
    void desktopShellOpensWithTheAssociatedProgram() {
        const QString home = folder(u"desktop"_s);
        const QString data = home + u"/data"_s;
        const QString config = home + u"/config"_s;
        QDir().mkpath(data + u"/applications"_s);
        QDir().mkpath(config);
        const QString noted = home + u"/opened.txt"_s;
        writeFile(home + u"/fake-sheet"_s,
                  ("#!/bin/sh\nprintf '%s' \"$1\" > '" + noted.toUtf8() + "'\n"));
        QFile::setPermissions(home + u"/fake-sheet"_s, QFile::ReadOwner | QFile::ExeOwner);
        const QString mime = u"application/vnd.openxmlformats-officedocument.spreadsheetml.sheet"_s;

        const QList<QByteArray> names{"XDG_DATA_HOME",       "XDG_CONFIG_HOME", "XDG_DATA_DIRS",
                                      "XDG_CURRENT_DESKTOP", "DESKTOP_SESSION", "DISPLAY"};
        QList<QByteArray> saved;
        for (const QByteArray& name : names)
            saved.append(qgetenv(name.constData()));
        const auto restore = qScopeGuard([&] {
            for (int i = 0; i < names.size(); ++i) {
                if (saved[i].isNull())
                    qunsetenv(names[i].constData());
                else
                    qputenv(names[i].constData(), saved[i]);
            }
        });
        qputenv("XDG_DATA_HOME", QFile::encodeName(data));
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(config));
        qputenv("XDG_DATA_DIRS", QFile::encodeName(home + u"/nothing"_s));
        qunsetenv("XDG_CURRENT_DESKTOP");
        qunsetenv("DESKTOP_SESSION");
        qputenv("DISPLAY", ":99"); // xdg-open opens files only "with a display"

        FakeDialogs dialogs;
        DesktopShell shell;
        const QString cache = folder(u"desktop-cache"_s);
        ResultsSaver(dialogs, shell, cache)
            .save(OutputChoice::ExcelTwoCells, ListRows({{u"Ann"_s, u"Lee"_s}}));
        verifyOneReport(dialogs, 140, u"There is no program on this desktop that opens xlsx"_s);
        QCOMPARE(entries(cache), QStringList{});

        writeFile(
            data + u"/applications/fake-sheet.desktop"_s,
            "[Desktop Entry]\nType=Application\nName=Fake Sheet\nExec=" + QFile::encodeName(home) +
                "/fake-sheet %f\nMimeType=" + mime.toUtf8() + ";\n");
        QProcess mimeDefault;
        mimeDefault.start(u"xdg-mime"_s, {u"default"_s, u"fake-sheet.desktop"_s, mime});
        QVERIFY(mimeDefault.waitForFinished(10000));

        dialogs.clear();
        ResultsSaver(dialogs, shell, cache)
            .save(OutputChoice::ExcelTwoCells, ListRows({{u"Ann"_s, u"Lee"_s}}));
        QCOMPARE(dialogs.messages(), QStringList{});
        const QStringList files = entries(cache);
        QCOMPARE(files.size(), 1);
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(noted), 10000);
        QTRY_COMPARE_WITH_TIMEOUT(QString::fromUtf8(readAll(noted)), QDir(cache).filePath(files[0]),
                                  10000);
    }
};

QTEST_GUILESS_MAIN(TestSaving)
#include "tst_saving.moc"
