// Saving the results list: the text file's bytes and its safe replacement,
// the workbook as an independent reader sees it, and the reports a user gets
// when something fails.
#include "app/resultssaver.h"
#include "base/errorreport.h"
#include "base/failure.h"
#include "base/safefile.h"
#include "results/resultrows.h"
#include "results/resultsmodel.h"
#include "results/spreadsheet.h"
#include "results/textfile.h"
#include "support/fakedialogs.h"
#include "support/fakeplatform.h"
#include "support/program.h"
#include "support/workbook.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QScopeGuard>
#include <QTemporaryDir>
#include <QTemporaryFile>
#include <QTest>

#include <csignal>
#include <cstdio>
#include <functional>
#include <thread>

#include <fcntl.h>
#include <grp.h>
#include <pwd.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/wait.h>
#include <unistd.h>

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

// The rows kept as indices into one table of first names and one of last
// names, as a run makes them.
void setIndexedRows(ResultsModel& model, const Names& names)
{
    GeneratedNames generated;
    for (const auto& [first, last] : names) {
        if (!generated.firstNames.contains(first))
            generated.firstNames << first;
        if (!generated.lastNames.contains(last))
            generated.lastNames << last;
        generated.rows.push_back({std::uint32_t(generated.firstNames.indexOf(first)),
                                  std::uint32_t(generated.lastNames.indexOf(last))});
    }
    model.setRows(generated);
}

// What work throws as a failure: its text, empty for none.
QString failureOf(const std::function<void()>& work)
{
    try {
        work();
    } catch (const Failure& failure) {
        return failure.description();
    }
    return {};
}

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

// What a save is pointed at, in a folder that holds "out" (mode 640) and
// the names database.
enum class Target {
    Regular,
    NewName,
    Link,             // "link" -> out
    PlantedLink,      // the same, made by another user in a shared folder
    ReadOnly,         // out, mode 444, saved by an unprivileged user
    Fifo,             // a reader takes what is written
    FifoReaderGone,   // the reader leaves before the end
    NullDevice,       // a character device like /dev/null
    FullDevice,       // like /dev/full
    FileSizeLimit,    // the process may write no more than 4 KB to a file
    DiskFull,         // the folder is a small file system of its own
    FewRowsSizeLimit, // the same two with two rows, which fit: a workbook
    FewRowsDiskFull,  // still needs the room to be zipped
    Stale,            // temporary files of other processes beside out
    DatabaseRelative, // names.mdb, from the folder itself
    DatabaseLink,     // "link.txt" -> names.mdb
};

const QString NamesDatabase = u"it is the names database, whose lists the results would replace"_s;

// Saves rows to path as a text file through the results window, or as a
// workbook as quillane-cli saves one; the failure's text, empty for none.
QString saveAs(bool workbook, const QString& path, const QString& database, const ResultRows& rows)
{
    if (workbook)
        return failureOf(
            [&] { saveWorkbook(rows, OutputChoice::SpreadsheetTwoCells, path, database); });
    FakeDialogs dialogs;
    FakeShell shell;
    dialogs.answerSave(path);
    ResultsSaver(dialogs, shell, QDir::tempPath(), database).save(OutputChoice::TextFile, rows);
    if (dialogs.messages().isEmpty())
        return {};
    const QString report = dialogs.messages().constLast();
    const QString description = report.section(u"\r\n"_s, 0, 0);
    return report
                   == errorReportText(description, u"in Tessmark.Form2.PushButton2_Click "_s, 30,
                                      ClosingLine::Long)
               ? description
               : u"not the report of step 30: "_s + report;
}

// Runs work in a child process as the unprivileged user "nobody" and
// returns what it returns.
QString asNobody(const std::function<QString()>& work)
{
    const passwd* nobody = ::getpwnam("nobody");
    int channel[2];
    if (!nobody || ::pipe(channel) != 0)
        return u"no user nobody"_s;
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(channel[0]);
        if (::setgroups(0, nullptr) != 0 || ::setgid(nobody->pw_gid) != 0
            || ::setuid(nobody->pw_uid) != 0)
            leaveChild(2);
        const QByteArray answer = work().toUtf8();
        const bool sent =
            ::write(channel[1], answer.constData(), std::size_t(answer.size())) == answer.size();
        leaveChild(sent ? 0 : 1);
    }
    ::close(channel[1]);
    QFile answer;
    QByteArray bytes;
    if (answer.open(channel[0], QIODevice::ReadOnly, QFileDevice::AutoCloseHandle))
        bytes = answer.readAll();
    int status = 0;
    ::waitpid(child, &status, 0);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0 ? QString::fromUtf8(bytes)
                                                         : u"the child failed"_s;
}

// A process id that no process has (any more).
pid_t deadProcess()
{
    const pid_t child = ::fork();
    if (child == 0)
        ::_exit(0);
    ::waitpid(child, nullptr, 0);
    return child;
}

mode_t modeOf(const QString& path)
{
    struct stat info {};
    return ::lstat(QFile::encodeName(path).constData(), &info) == 0 ? info.st_mode : 0;
}

bool setAge(const QString& path, int days)
{
    QFile file(path);
    return file.open(QIODevice::ReadWrite)
           && file.setFileTime(QDateTime::currentDateTime().addDays(-days),
                               QFileDevice::FileModificationTime);
}

void writeFile(const QString& path, const QByteArray& bytes)
{
    QFile file(path);
    if (file.open(QIODevice::WriteOnly))
        file.write(bytes);
}

} // namespace

class TestSaving : public QObject {
    Q_OBJECT

private Q_SLOTS:
    // The save dialog's answer is a name in a folder that holds old.txt and
    // sub/, or empty for a cancel. (The bytes of a list, and a write that
    // fails part way: layoutsOfTheRows, everyFileByOneRule.)
    void textFile_data()
    {
        QTest::addColumn<Names>("names");
        QTest::addColumn<QString>("answer");
        QTest::addColumn<QByteArray>("bytes"); // of the answered file; old.txt holds "old"
        QTest::addColumn<QStringList>("files");
        QTest::addColumn<bool>("fails");

        const QStringList kept{u"old.txt"_s, u"sub"_s}, added = QStringList{u"names.txt"_s} + kept;
        const QByteArray annBob("Ann Lee\r\nBob Stone\r\n"), none;
        QTest::newRow("empty list") << Names{} << u"names.txt"_s << none << added << false;
        QTest::newRow("replaced, no question") << AnnBob << u"old.txt"_s << annBob << kept << false;
        QTest::newRow("used as typed")
            << AnnBob << u"names"_s << annBob << QStringList{u"names"_s} + kept << false;
        QTest::newRow("cancel") << AnnBob << QString() << none << kept << false;
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
        const QString old = dir.filePath(u"old.txt"_s);
        writeFile(old, "old");
        FakeDialogs dialogs;
        FakeShell shell;
        dialogs.answerSave(answer.isEmpty() ? QString() : dir.filePath(answer)); // empty: cancel
        ResultsSaver(dialogs, shell, dir.path()).save(OutputChoice::TextFile, ListRows(names));

        QTEST(entries(dir.path()), "files"); // no temporary file left behind
        if (fails)
            verifyOneReport(dialogs, 30, u"The file "_s + dir.filePath(answer) + u" could not"_s);
        else if (!answer.isEmpty())
            QCOMPARE(readAll(dir.filePath(answer)), bytes);
        QCOMPARE(readAll(old), answer == u"old.txt"_s ? bytes : QByteArray("old"));
        // The save dialog, and nothing after it but a failure's report.
        QCOMPARE(dialogs.shown.size(), fails ? 2 : 1);
    }

    // Rows kept as indices into tables are written from names encoded once
    // per table; other rows name by name. Both give the same bytes in every
    // layout. A CSV field is quoted, its quotes doubled, where a reader
    // would split it: at a comma, a quote, and either half of a line end.
    void layoutsOfTheRows_data()
    {
        QTest::addColumn<QByteArray (*)(const ResultRows&)>("layout");
        QTest::addColumn<Names>("names");
        QTest::addColumn<QByteArray>("bytes");
        const Names rows{{u"Zoë"_s, u"Lee"_s},
                         {u"Ann"_s, u"\"Jr\""_s},
                         {u"Zoë"_s, u"\"Jr\""_s},
                         {u"Ann, B"_s, u"Lee"_s}};
        QTest::newRow("text")
            << &resultsText << rows
            << u"Zoë Lee\r\nAnn \"Jr\"\r\nZoë \"Jr\"\r\nAnn, B Lee\r\n"_s.toUtf8();
        QTest::newRow("lines") << &resultsLines << rows
                               << u"Zoë Lee\nAnn \"Jr\"\nZoë \"Jr\"\nAnn, B Lee\n"_s.toUtf8();
        QTest::newRow("csv") << &resultsCsv << rows
                             << u"first_name,last_name\r\nZoë,Lee\r\nAnn,\"\"\"Jr\"\"\"\r\n"
                                u"Zoë,\"\"\"Jr\"\"\"\r\n\"Ann, B\",Lee\r\n"_s.toUtf8();
        const auto csvField = [](const char* tag, const QString& name, const QByteArray& field) {
            QTest::newRow(tag) << &resultsCsv << Names{{name, name}}
                               << "first_name,last_name\r\n" + field + ',' + field + "\r\n";
        };
        csvField("csv: CR", u"Ann\rBo"_s, "\"Ann\rBo\"");
        csvField("csv: LF", u"Ann\nBo"_s, "\"Ann\nBo\"");
        csvField("csv: CR LF", u"Ann\r\nBo"_s, "\"Ann\r\nBo\"");
    }

    void layoutsOfTheRows()
    {
        using Layout = QByteArray (*)(const ResultRows&);
        QFETCH(Layout, layout);
        QFETCH(Names, names);
        ResultsModel indexed;
        setIndexedRows(indexed, names);
        QVERIFY(indexed.indexedNames());
        QTEST(layout(indexed), "bytes");
        QTEST(layout(ListRows(names)), "bytes");
    }

    // The results list as a view reads and edits it: the first name alone
    // is retyped in place, and retyping it as it was changes nothing, so
    // the rows are still saved from names encoded once.
    void theResultsListAsAViewSeesIt()
    {
        ResultsModel model;
        model.addColumn(u"First"_s);
        model.addColumn(u"Last"_s);
        setIndexedRows(model, {{u"Ann"_s, u"Lee"_s}});
        const QModelIndex first = model.index(0, 0), last = model.index(0, 1), none;
        QCOMPARE(model.data(first, Qt::EditRole), QVariant(u"Ann"_s));
        QCOMPARE(model.data(last, Qt::DisplayRole), QVariant(u"Lee"_s));
        QCOMPARE(model.data(first, Qt::ToolTipRole), QVariant());
        QCOMPARE(model.data(none, Qt::DisplayRole), QVariant());
        QCOMPARE(model.rowCount(first) + model.columnCount(first), 0);
        QCOMPARE(model.firstName(1) + model.firstName(-1) + model.lastName(1), QString());
        QCOMPARE(model.headerData(1, Qt::Horizontal, Qt::DisplayRole), QVariant(u"Last"_s));
        QCOMPARE(model.headerData(2, Qt::Horizontal, Qt::DisplayRole), QVariant());
        QCOMPARE(model.headerData(0, Qt::Vertical, Qt::DisplayRole), QVariant());
        QVERIFY(model.flags(first) & Qt::ItemIsEditable);
        QVERIFY(!(model.flags(last) & Qt::ItemIsEditable));
        QCOMPARE(model.flags(none), Qt::NoItemFlags);
        QVERIFY(!model.setData(last, u"Bo"_s, Qt::EditRole));
        QVERIFY(!model.setData(first, u"Bo"_s, Qt::DisplayRole));
        QVERIFY(model.setData(first, u"Ann"_s, Qt::EditRole));
        QVERIFY(model.indexedNames());
        QVERIFY(model.setData(first, u"Bo"_s, Qt::EditRole));
        QVERIFY(!model.indexedNames());
        QCOMPARE(resultsText(model), QByteArray("Bo Lee\r\n"));
    }

    // Every file is written by one rule, the same for a text file and a
    // workbook: what can be replaced is replaced whole or not at all, with
    // its mode; a link's target is replaced; devices and FIFOs are written
    // as they are; what the user may not write, and the names database
    // however reached, are refused; failures give the system's text.
    void everyFileByOneRule_data()
    {
        QTest::addColumn<bool>("workbook");
        QTest::addColumn<Target>("target");
        QTest::addColumn<QString>("error"); // after "could not be saved: "; empty for none
        for (const bool workbook : {false, true}) {
            const auto row = [workbook](const char* name, Target target, const QString& error) {
                QTest::addRow("%s: %s", workbook ? "workbook" : "text", name)
                    << workbook << target << error;
            };
            row("regular file", Target::Regular, {});
            row("new name", Target::NewName, {});
            row("link: its target", Target::Link, {});
            row("link of another user in a shared folder", Target::PlantedLink,
                u"Permission denied"_s);
            row("read-only file", Target::ReadOnly, u"Permission denied"_s);
            row("FIFO", Target::Fifo, {});
            row("FIFO, reader gone", Target::FifoReaderGone, u"Broken pipe"_s);
            row("character device", Target::NullDevice, {});
            row("device full", Target::FullDevice, u"No space left on device"_s);
            row("file size limit", Target::FileSizeLimit, u"File too large"_s);
            row("disk full", Target::DiskFull, u"No space left on device"_s);
            row("file size limit, two rows", Target::FewRowsSizeLimit,
                workbook ? u"File too large"_s : QString());
            row("disk full, two rows", Target::FewRowsDiskFull,
                workbook ? u"No space left on device"_s : QString());
            row("stale temporary files", Target::Stale, {});
            row("database, relative", Target::DatabaseRelative, NamesDatabase);
            row("database, link", Target::DatabaseLink, NamesDatabase);
        }
    }

    void everyFileByOneRule()
    {
        QFETCH(bool, workbook);
        QFETCH(Target, target);
        QFETCH(QString, error);
        const QList<Target> rootOnly{Target::PlantedLink, Target::ReadOnly,
                                     Target::NullDevice,  Target::FullDevice,
                                     Target::DiskFull,    Target::FewRowsDiskFull};
        if (::geteuid() != 0 && rootOnly.contains(target))
            QSKIP("Needs root: to make a device node, give a link to another user, mount a small "
                  "file system, or run a child as an unprivileged user (root writes any file).");

        QTemporaryDir dir;
        const QByteArray folder = QFile::encodeName(dir.path());
        bool mounted = false;
        const auto unmount = qScopeGuard([&] {
            if (mounted)
                ::umount2(folder.constData(), MNT_DETACH);
        });
        if (target == Target::DiskFull || target == Target::FewRowsDiskFull) {
            mounted = ::mount("tmpfs", folder.constData(), "tmpfs", 0, "size=256k") == 0;
            if (!mounted)
                QSKIP("No small file system can be mounted here.");
        }
        // A workbook for a device or a FIFO is built in the temporary folder:
        // the row's own here. A relative path starts in the row's folder.
        const auto restore = qScopeGuard([current = QDir::currentPath(), tmp = qgetenv("TMPDIR")] {
            QDir::setCurrent(current);
            qputenv("TMPDIR", tmp);
        });
        QTemporaryFile errors;
        QVERIFY(errors.open());
        QVERIFY(QDir(dir.path()).mkdir(u"tmp"_s));
        qputenv("TMPDIR", QFile::encodeName(dir.filePath(u"tmp"_s)));

        // The independent reader takes a workbook by its extension only.
        const QString extension = workbook ? u".xlsx"_s : u".txt"_s;
        const QString out = dir.filePath(u"out"_s + extension),
                      database = dir.filePath(u"names.mdb"_s);
        writeFile(out, "old");
        QFile::setPermissions(out, QFile::ReadOwner | QFile::WriteOwner | QFile::ReadGroup);
        writeFile(database, "names");
        const QString fresh = SafeFile::temporaryPrefix(::getppid()) + u"Fresh1.part"_s;
        const QString dead = SafeFile::temporaryPrefix(deadProcess()) + u"Dead01.part"_s;
        const QString old = SafeFile::temporaryPrefix(::getppid()) + u"Old001.part"_s;
        const QString notOurs = u".quillane-notes.part"_s;

        QString path = out;
        mode_t kind = S_IFREG; // of what path names, kept as it was
        std::thread reader;
        QByteArray received;
        switch (target) {
        case Target::NewName:
            path = dir.filePath(u"new"_s + extension);
            break;
        case Target::Link:
        case Target::PlantedLink:
        case Target::DatabaseLink:
            path = dir.filePath(u"link"_s);
            kind = S_IFLNK;
            QVERIFY(QFile::link(target == Target::DatabaseLink ? database : out, path));
            if (target == Target::PlantedLink) {
                const passwd* nobody = ::getpwnam("nobody");
                QVERIFY(nobody
                        && ::lchown(QFile::encodeName(path).constData(), nobody->pw_uid, gid_t(-1))
                               == 0);
                QVERIFY(::chmod(folder.constData(), 01777) == 0);
            }
            break;
        case Target::ReadOnly:
            QFile::setPermissions(out, QFile::ReadOwner | QFile::ReadGroup | QFile::ReadOther);
            // The folder lets anyone make a file: only the file's mode refuses.
            QVERIFY(::chmod(folder.constData(), 0777) == 0);
            break;
        case Target::Fifo:
        case Target::FifoReaderGone:
            path = dir.filePath(u"fifo"_s);
            kind = S_IFIFO;
            QVERIFY(::mkfifo(QFile::encodeName(path).constData(), 0600) == 0);
            reader = std::thread([&, all = target == Target::Fifo] {
                QFile fifo(path);
                if (fifo.open(QIODevice::ReadOnly) && all)
                    received = fifo.readAll();
            });
            break;
        case Target::NullDevice:
        case Target::FullDevice:
            path = dir.filePath(u"device"_s);
            kind = S_IFCHR;
            QVERIFY(::mknod(QFile::encodeName(path).constData(), kind | 0666,
                            ::makedev(1, target == Target::NullDevice ? 3 : 7))
                    == 0);
            break;
        case Target::Stale:
            for (const QString& name : {fresh, dead, old, notOurs})
                writeFile(dir.filePath(name), "part");
            QVERIFY(setAge(dir.filePath(old), 2));
            break;
        case Target::DatabaseRelative:
            QVERIFY(QDir::setCurrent(dir.path()));
            path = u"names.mdb"_s;
            break;
        default:
            break;
        }

        // More than a pipe or the small disk holds, in a workbook too.
        ListRows rows(AnnBob);
        if (target == Target::FileSizeLimit || target == Target::DiskFull
            || target == Target::FifoReaderGone) {
            rows.names.clear();
            for (int i = 0; i < 20000; ++i)
                rows.names.append({u"First%1"_s.arg(i * 7919 % 20011), u"Last%1"_s.arg(i)});
        }
        const auto save = [&] { return saveAs(workbook, path, database, rows); };
        // Nothing on standard error beside the one report: not the workbook
        // writer's own lines either.
        std::fflush(stderr);
        const int standardError = ::dup(STDERR_FILENO);
        ::dup2(errors.handle(), STDERR_FILENO);
        QString failure;
        if (target == Target::ReadOnly) {
            failure = asNobody(save);
        } else if (target == Target::FileSizeLimit || target == Target::FewRowsSizeLimit) {
            // The signal as a program gets it: it must not end the program.
            const rlimit small{4096, RLIM_INFINITY}, unlimited{RLIM_INFINITY, RLIM_INFINITY};
            std::signal(SIGXFSZ, SIG_DFL);
            setrlimit(RLIMIT_FSIZE, &small);
            failure = save();
            setrlimit(RLIMIT_FSIZE, &unlimited);
        } else {
            std::signal(SIGPIPE, SIG_DFL);
            failure = save();
        }
        std::fflush(stderr);
        ::dup2(standardError, STDERR_FILENO);
        ::close(standardError);
        if (reader.joinable()) {
            if (!failure.isEmpty()) // let a reader that got nothing go
                ::close(::open(path.toLocal8Bit().constData(), O_WRONLY | O_NONBLOCK));
            reader.join();
        }
        QCOMPARE(errors.readAll(), QByteArray());

        QCOMPARE(failure, error.isEmpty()
                              ? QString()
                              : u"The file %1 could not be saved: %2"_s.arg(path, error));

        const QByteArray text("Ann Lee\r\nBob Stone\r\n");
        const QString cells = u"A1 Ann,B1 Lee,A2 Bob,B2 Stone"_s;
        const auto holdsTheRows = [&](const QString& file) {
            return workbook ? readWorkbook(file) == cells : readAll(file) == text;
        };
        const bool replaced =
            error.isEmpty()
            && (target == Target::Regular || target == Target::Link || target == Target::Stale
                || target == Target::FewRowsSizeLimit || target == Target::FewRowsDiskFull);
        QVERIFY(replaced ? holdsTheRows(out) : readAll(out) == "old");
        QCOMPARE(modeOf(out) & 0777, target == Target::ReadOnly ? 0444u : 0640u);
        QCOMPARE(readAll(database), QByteArray("names"));
        if (target == Target::NewName) {
            QVERIFY(holdsTheRows(path));
            const mode_t mask = ::umask(0);
            ::umask(mask);
            QCOMPARE(modeOf(path) & 0777, 0666 & ~mask);
        }
        QCOMPARE(modeOf(path) & S_IFMT, kind);
        if (target == Target::Fifo)
            QVERIFY(workbook ? received.startsWith("PK\x03\x04") : received == text);

        // No temporary file is left, and of the others' only those whose
        // process still runs and that are not old, and names not ours.
        QStringList left = entries(dir.path()).filter(u".part"_s);
        left.sort();
        QCOMPARE(left, (target == Target::Stale ? QStringList{fresh, notOurs} : QStringList()));
        QCOMPARE(entries(dir.filePath(u"tmp"_s)), QStringList());
    }

    // The sheet's limits: 1,048,576 rows, 16,384 columns (XFD), 32,767
    // characters in a cell. A cell past them is refused, naming the cell.
    void cellsAtTheSheetsLimits_data()
    {
        QTest::addColumn<int>("row");
        QTest::addColumn<int>("column");
        QTest::addColumn<int>("length");
        QTest::addColumn<QString>("error");
        const QString outside = u"Worksheet row or column index out of range. (cell %1)"_s;
        const QString tooLong = u"String exceeds Excel's limit of 32,767 characters. (cell A1)"_s;
        QTest::newRow("the last row") << 1048576 << 1 << 3 << QString();
        QTest::newRow("past the last row") << 1048577 << 1 << 3 << outside.arg(u"A1048577"_s);
        QTest::newRow("the last column") << 1 << 16384 << 3 << QString();
        QTest::newRow("past the last column") << 1 << 16385 << 3 << outside.arg(u"XFE1"_s);
        QTest::newRow("row 0") << 0 << 1 << 3 << u"There is no cell at row 0, column 1"_s;
        QTest::newRow("column 0") << 1 << 0 << 3 << u"There is no cell at row 1, column 0"_s;
        QTest::newRow("32,767 characters") << 1 << 1 << 32767 << QString();
        QTest::newRow("32,768 characters") << 1 << 1 << 32768 << tooLong;
    }

    void cellsAtTheSheetsLimits()
    {
        QFETCH(int, row);
        QFETCH(int, column);
        QFETCH(int, length);
        QTemporaryDir dir;
        const QString path = dir.filePath(u"out.xlsx"_s);
        const QString error = failureOf([&] {
            WorkbookFile book(std::make_unique<SafeFile>(path));
            book.sheet().cells(row, column) = QString(length, u'x');
            book.save();
        });
        QTEST(error, "error");
        QCOMPARE(entries(dir.path()), error.isEmpty() ? QStringList{u"out.xlsx"_s} : QStringList());
    }

    // What a caller of the workbook and the spreadsheet sees when it calls
    // them out of turn, or when the folder goes away before the end.
    void workbookCallsOutOfTurn_data()
    {
        QTest::addColumn<QString>("calls");
        QTest::addColumn<QString>("error");
        QTest::addColumn<int>("documents"); // handed to the desktop
        const auto row = [](const char* calls, const QString& error, int documents) {
            QTest::newRow(calls) << QString::fromLatin1(calls) << error << documents;
        };
        const QString holds = u"The spreadsheet already holds a workbook"_s;
        row("add fill show", {}, 1);
        row("add show show hide", {}, 1);
        row("add add", holds, 0);
        row("fill", u"There is no workbook"_s, 0);
        row("show", u"There is no workbook to show"_s, 0);
        row("add show add", holds, 1);
        row("add fill remove show", u"could not be saved: No such file or directory"_s, 0);
    }

    void workbookCallsOutOfTurn()
    {
        QFETCH(QString, calls);
        QTemporaryDir dir;
        const QString folder = dir.filePath(u"cache"_s);
        FakeShell shell;
        const QString failure = failureOf([&] {
            SpreadsheetApplication spreadsheet(shell, folder);
            for (const QString& call : calls.split(u' ')) {
                if (call == u"add")
                    spreadsheet.Workbooks().Add();
                else if (call == u"fill")
                    spreadsheet.ActiveWorkbook().ActiveSheet().cells(1, 1) = u"Ann"_s;
                else if (call == u"remove")
                    QDir(folder).removeRecursively();
                else
                    spreadsheet.setVisible(call == u"show");
            }
        });
        QFETCH(QString, error);
        QVERIFY2(error.isEmpty() ? failure.isEmpty() : failure.endsWith(error),
                 qPrintable(failure));
        QTEST(int(shell.documents.size()), "documents");
        QCOMPARE(entries(folder).size(), qsizetype(shell.documents.size()));
    }

    // A workbook is never given the name of a file that is there: one made
    // in the same second as others is told apart by a number from 2 up to
    // 1000 (999 taken gives 1000 only when the count starts at 2).
    void aWorkbookNeverReplacesAFile_data()
    {
        QTest::addColumn<int>("taken");    // workbooks of this second already there
        QTest::addColumn<QString>("name"); // after the second; empty: refused
        QTest::newRow("none") << 0 << u".xlsx"_s;
        QTest::newRow("999") << 999 << u" (1000).xlsx"_s;
        QTest::newRow("1000") << 1000 << QString();
    }

    void aWorkbookNeverReplacesAFile()
    {
        QFETCH(int, taken);
        QFETCH(QString, name);
        // Thousands of names come and go much faster in memory, where a
        // file system there can be written.
        const bool inMemory = QFileInfo(u"/dev/shm"_s).isWritable();
        QTemporaryDir temporary((inMemory ? u"/dev/shm"_s : QDir::tempPath())
                                + u"/quillane-XXXXXX"_s);
        QDir dir;
        // This second's and the next's, whichever the workbook is made in;
        // once more in a new folder when making them took longer than that.
        for (int attempt = 0;; ++attempt) {
            QVERIFY(attempt < 10);
            dir.setPath(temporary.filePath(QString::number(attempt)));
            QVERIFY(dir.mkpath(u"."_s));
            const QDateTime now = QDateTime::currentDateTime();
            for (const QDateTime& moment : {now, now.addSecs(1)}) {
                const QString stem = moment.toString(u"'Quillane names 'yyyy-MM-dd HH.mm.ss"_s);
                // A file, then links to nothing, which are names taken all the same.
                if (taken > 0)
                    writeFile(dir.filePath(stem + u".xlsx"_s), "theirs");
                for (int n = 2; n <= taken; ++n)
                    QVERIFY(
                        QFile::link(u"theirs"_s, dir.filePath(u"%1 (%2).xlsx"_s.arg(stem).arg(n))));
            }
            if (QDateTime::currentSecsSinceEpoch() <= now.toSecsSinceEpoch() + 1)
                break;
        }
        FakeShell shell;
        SpreadsheetApplication spreadsheet(shell, dir.path());
        const QString failure = failureOf([&] {
            spreadsheet.Workbooks().Add();
            spreadsheet.setVisible(true);
        });
        const QRegularExpression named(u"/Quillane names [0-9. -]{19}"_s
                                       + QRegularExpression::escape(name) + u'$');
        if (name.isEmpty())
            QCOMPARE(failure,
                     u"The folder %1 holds too many workbooks of this second"_s.arg(dir.path()));
        else
            QVERIFY2(named.match(spreadsheet.documentPath()).hasMatch(),
                     qPrintable(spreadsheet.documentPath()));
        QCOMPARE(shell.documents,
                 name.isEmpty() ? QStringList() : QStringList{spreadsheet.documentPath()});
        QCOMPARE(dir.entryList(QDir::AllEntries | QDir::System | QDir::NoDotAndDotDot).size(),
                 2 * taken + !name.isEmpty());
    }

    // A workbook is made in the cache folder, its cells as an independent
    // reader sees them, and handed to the desktop. One that cannot be made,
    // filled whole or shown is neither handed over nor left in the cache
    // folder: one report, at the step that failed.
    void workbook_data()
    {
        QTest::addColumn<OutputChoice>("choice");
        QTest::addColumn<Names>("names");
        QTest::addColumn<QString>("cacheName"); // in a folder that holds "file"
        QTest::addColumn<bool>("program");      // the desktop has one for workbooks
        QTest::addColumn<int>("line");          // of the report; 0: none
        QTest::addColumn<QString>("shown");     // the cells read back, or the report's start

        const auto two = OutputChoice::SpreadsheetTwoCells, one = OutputChoice::SpreadsheetOneCell;
        // Names that look like a number, a truth value and formulas stay text.
        const Names rows{{u"Ann"_s, u"Lee"_s}, {u"007"_s, u"TRUE"_s}, {u"=1+2"_s, u"1e5"_s}};
        const QString cache = u"cache"_s;
        QTest::newRow("2 cells") << two << rows << cache << true << 0
                                 << u"A1 Ann,B1 Lee,A2 007,B2 TRUE,A3 =1+2,B3 1e5"_s;
        QTest::newRow("1 cell") << one << rows << cache << true << 0
                                << u"A1 Ann Lee,A2 007 TRUE,A3 =1+2 1e5"_s;
        QTest::newRow("1 cell: UTF-8")
            << one << Foreign << cache << true << 0 << u"A1 Zoë Łukasiewicz,A2 山田 太郎"_s;
        QTest::newRow("no program for workbooks")
            << two << AnnBob << cache << false << 140 << u"There is no program"_s;
        QTest::newRow("no cache folder")
            << two << AnnBob << u"file/cache"_s << true << 110 << u"The folder "_s;
        // A first name retyped in the results list may be longer than a cell holds.
        const QString tooLong = u"String exceeds Excel's limit of 32,767 characters. (cell A2)"_s;
        const Names long2{AnnBob[0], {QString(32768, u'x'), u"Lee"_s}, AnnBob[1]};
        const Names long1{AnnBob[0], {QString(32764, u'x'), u"Lee"_s}, AnnBob[1]};
        QTest::newRow("a cell too long, 2 cells")
            << two << long2 << cache << true << 130 << tooLong;
        QTest::newRow("a cell too long, 1 cell") << one << long1 << cache << true << 130 << tooLong;
    }

    void workbook()
    {
        QFETCH(OutputChoice, choice);
        QFETCH(Names, names);
        QFETCH(QString, cacheName);
        QFETCH(bool, program);
        QFETCH(int, line);
        QFETCH(QString, shown);
        if (line == 0)
            SKIP_WITHOUT_WORKBOOK_READER();
        QTemporaryDir dir;
        writeFile(dir.filePath(u"file"_s), "file");
        const QString cache = dir.filePath(cacheName);
        FakeDialogs dialogs;
        FakeShell shell;
        shell.hasDocumentProgram = program;
        ResultsSaver(dialogs, shell, cache).save(choice, ListRows(names));
        if (line == 0) {
            QCOMPARE(shell.documents, QStringList{QDir(cache).filePath(entries(cache).join(u'|'))});
            QCOMPARE(readWorkbook(shell.documents.value(0)), shown);
        } else {
            verifyOneReport(dialogs, line, shown);
            QCOMPARE(shell.documents, QStringList());
            QCOMPARE(entries(cache), QStringList());
        }
        QCOMPARE(readAll(dir.filePath(u"file"_s)), QByteArray("file"));
    }
};

QTEST_GUILESS_MAIN(TestSaving)
#include "tst_saving.moc"
