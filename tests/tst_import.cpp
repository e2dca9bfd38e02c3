// Importing names from text files: how a file's bytes become names, what
// the user is told, and that no file, however strange, harms the database.
#include "app/listeditor.h"
#include "names/listoperations.h"
#include "names/namelists.h"
#include "names/namesplitter.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QProcess>
#include <QRandomGenerator>
#include <QScopeGuard>
#include <QTest>

#include <dlfcn.h>
#include <sqlite3.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/types.h>

#include <cerrno>
#include <csignal>
#include <optional>

using namespace Qt::StringLiterals;

namespace {

const ListChoice User{false, true, true, false, false};

// What an import of the bytes stores: the names the splitter finds in them
// all at once, but for those too long to keep.
QStringList storable(const QByteArray& bytes)
{
    QStringList texts;
    for (const NameSplitter::Name& name : NameSplitter::split(bytes))
        if (!name.overlong())
            texts += name.text;
    return texts;
}

// The editor over a fresh copy of the shipped database (or of another),
// importing first names into the user list.
struct Rig {
    explicit Rig(const QString& database = {})
        : env(database.isEmpty())
    {
        if (!database.isEmpty())
            QFile::copy(database, db);
    }
    QStringList firstNames() const { return tableColumn(db, u"user_firstname"_s, u"*"_s); }

    TestEnvironment env;
    const QString db = env.databasePath();
    FakePointer pointer;
    ListChoice choice = User;
    NameLists lists{db};
    ListEditor editor{env.dialogs, db, lists, pointer, [this] { return choice; }};
};

// A file system over the system's own that fails one write when armed: the
// n-th write after arming returns an error, as a failing or full disk would,
// and every other call goes through. Or it opens each database read-only, as
// the system does a file that may not be written. Registered as the default,
// so the program's own connections use it.
namespace FaultyDisk {

sqlite3_vfs* system = nullptr;
sqlite3_vfs vfs;
sqlite3_io_methods methods;
int writesToFail = 0; // 0: none
int failWith = SQLITE_IOERR_WRITE;
bool readOnly = false;
bool failed = false;

struct File {
    sqlite3_file base;
    sqlite3_file* real;
};

sqlite3_file* real(sqlite3_file* file)
{
    return reinterpret_cast<File*>(file)->real;
}

// The system's own method of the file, called for it.
template <auto Method>
struct Forward;
template <typename... Args, int (*sqlite3_io_methods::*Method)(sqlite3_file*, Args...)>
struct Forward<Method> {
    static int call(sqlite3_file* file, Args... args)
    {
        return (real(file)->pMethods->*Method)(real(file), args...);
    }
};
template <auto Method>
constexpr auto forward = Forward<Method>::call;

int write(sqlite3_file* file, const void* data, int amount, sqlite3_int64 offset)
{
    if (writesToFail > 0 && --writesToFail == 0) {
        failed = true;
        return failWith;
    }
    return forward<&sqlite3_io_methods::xWrite>(file, data, amount, offset);
}

int open(sqlite3_vfs*, const char* name, sqlite3_file* base, int flags, int* outFlags)
{
    auto* file = reinterpret_cast<File*>(base);
    file->real = reinterpret_cast<sqlite3_file*>(file + 1);
    base->pMethods = nullptr;
    if (readOnly && (flags & SQLITE_OPEN_MAIN_DB)) {
        failed = true;
        flags = (flags & ~(SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE)) | SQLITE_OPEN_READONLY;
    }
    const int rc = system->xOpen(system, name, file->real, flags, outFlags);
    if (file->real->pMethods)
        base->pMethods = &methods;
    return rc;
}

void install()
{
    if (system)
        return;
    system = sqlite3_vfs_find(nullptr);
    vfs = *system;
    vfs.szOsFile = int(sizeof(File)) + system->szOsFile;
    vfs.zName = "faulty";
    vfs.pNext = nullptr;
    vfs.xOpen = open;
    // Version 1: no memory mapping and no shared memory, so every write of
    // the rollback journal and of the database passes through write().
    methods.iVersion = 1;
    methods.xClose = forward<&sqlite3_io_methods::xClose>;
    methods.xRead = forward<&sqlite3_io_methods::xRead>;
    methods.xWrite = write;
    methods.xTruncate = forward<&sqlite3_io_methods::xTruncate>;
    methods.xSync = forward<&sqlite3_io_methods::xSync>;
    methods.xFileSize = forward<&sqlite3_io_methods::xFileSize>;
    methods.xLock = forward<&sqlite3_io_methods::xLock>;
    methods.xUnlock = forward<&sqlite3_io_methods::xUnlock>;
    methods.xCheckReservedLock = forward<&sqlite3_io_methods::xCheckReservedLock>;
    methods.xFileControl = forward<&sqlite3_io_methods::xFileControl>;
    methods.xSectorSize = forward<&sqlite3_io_methods::xSectorSize>;
    methods.xDeviceCharacteristics = forward<&sqlite3_io_methods::xDeviceCharacteristics>;
    sqlite3_vfs_register(&vfs, 1);
}

} // namespace FaultyDisk

// A disk that fails the n-th read of one file with an I/O error once armed.
namespace FaultyRead {
ino_t file = 0; // 0: none
int readsToFail = 0;
} // namespace FaultyRead

} // namespace

// Every read of the process passes here, the program's reads of the file it
// imports among them.
extern "C" ssize_t read(int fd, void* data, size_t size)
{
    static const auto system =
        reinterpret_cast<ssize_t (*)(int, void*, size_t)>(dlsym(RTLD_NEXT, "read"));
    struct stat info {};
    if (FaultyRead::file != 0 && ::fstat(fd, &info) == 0 && info.st_ino == FaultyRead::file
        && --FaultyRead::readsToFail == 0) {
        errno = EIO;
        return -1;
    }
    return system(fd, data, size);
}

class TestImport : public QObject {
    Q_OBJECT

    const QString Full = u"database or disk is full"_s;
    const QString ReadOnly = u"attempt to write a readonly database"_s;

    // A names database without names: copied faster than the shipped one,
    // and the user list reads the same from it.
    QTemporaryDir m_fixtures;
    const QString m_empty = m_fixtures.filePath(u"names.mdb"_s);

private Q_SLOTS:
    void initTestCase() { createEmptyDatabase(m_empty); }

    void importing_data()
    {
        // The files in the dialog's order, a null one missing; the names as stored,
        // joined by '|' (null: see below); the reports; what a second connection
        // to the database does first and holds meanwhile; which read of the
        // first file fails (0: none).
        QTest::addColumn<QList<QByteArray>>("files");
        QTest::addColumn<QString>("names");
        QTest::addColumn<QStringList>("reports");
        QTest::addColumn<QByteArray>("other");
        QTest::addColumn<int>("failingRead");
        const auto row = [](const char* tag, const QList<QByteArray>& files, const QString& names,
                            const QStringList& reports = {}, const QByteArray& other = {},
                            int failingRead = 0) {
            QTest::newRow(tag) << files << names << reports << other << failingRead;
        };
        // In the reports, %1 stands for the test's folder.
        const QString at = u"in Tessmark.Main.FileToListview "_s;
        const QString locked = u"%1/names.mdb: database is locked"_s;
        constexpr ClosingLine Long = ClosingLine::Long;
        const auto refused = [&](const QString& text) {
            return errorReportText(text, at, 50, Long);
        };
        const QStringList notText{errorReportText(
            u"The file %1/0.txt is not text: it holds control characters. Nothing of it was "
            u"stored."_s,
            at, 40, Long)};
        row("LF only, no final line end", {"Ann\nBo\nCy"}, u"Ann|Bo|Cy"_s);
        row("CR only", {"Ann\rBo\rCy\r"}, u"Ann|Bo|Cy"_s);
        row("CR LF, final line end", {"Ann\r\nBo\r\nCy\r\n"}, u"Ann|Bo|Cy"_s);
        row("blank lines", {"\r\n\nAnn\n\n\r\rBo\r\n\r\nCy\n\n"}, u"Ann|Bo|Cy"_s);
        row("a line of spaces", {"Ann\n  \nBo"}, u"Ann|  |Bo"_s);
        row("O'Brien", {"O'Brien\n'''\n"}, u"OBrien"_s);
        row("byte-order mark", {"\xEF\xBB\xBFZo\xC3\xAB\nBo"}, u"Zoë|Bo"_s);
        row("UTF-16 with its mark", {QByteArray("\xFF\xFEZ\0o\0\xEB\0\n\0", 10)}, u"Zoë"_s);
        // Not UTF-8: the code page such lists are saved in on Windows.
        row("Windows-1252", {"M\xFCller\n\x80uro\nZo\xEB"}, u"Müller|€uro|Zoë"_s);
        // A file that is not text is refused whole.
        row("a NUL", {QByteArray("A\0nn\nBo", 7)}, u""_s, notText);
        row("an escape", {"Ann\n\x1B[2J\nBo"}, u""_s, notText);
        QByteArray noise(2 << 20, Qt::Uninitialized);
        QRandomGenerator(42).fillRange(reinterpret_cast<quint32*>(noise.data()), noise.size() / 4);
        row("random bytes", {noise}, u""_s, notText);
        // A control character in one name, past the start of the file, or a
        // tab: that name is refused, with the character written out.
        const QByteArray start = QByteArray("Ann\n").repeated(17000);
        row("a control character later", {start + "Es\x1B[2Jc\nBo"},
            (QStringList(17000, u"Ann"_s) << u"Bo"_s).join(u'|'),
            {refused(u"The name \"Es\\u001b[2Jc\" holds a control character and was not "
                     u"stored."_s)});
        row("a tab", {"Ann\tLee\nBo"}, u"Bo"_s,
            {refused(u"The name \"Ann\\tLee\" holds a control character and was not stored."_s)});
        row("cancel", {}, u""_s);
        row("several", {"Cy\n", {}, "Ann\n", "Bo\n"}, u"Cy|Ann|Bo"_s, {u"File not found"_s});
        row("a locked database", {"Ann\n"}, u""_s,
            {errorReportText(locked, at, 30, Long),
             errorReportText(locked, u"in Tessmark.Form1.PushButton6_Click "_s, 30, Long)},
            "begin exclusive");
        // Read in pieces: the names are those of the whole file split at
        // once, and the reports are bounded.
        row("across reads", {QByteArray("\xC3\xAB\n").repeated(100000)}, {});
        row("a 20 MB line", {QByteArray(20 << 20, 'z') + "\nAfter"}, {});
        // The file is read 256 KiB at a time: names and characters cut by a
        // read come out whole. Long names fill the first read but 4 bytes.
        const QByteArray pad =
            QByteArray(QByteArray(249, 'p') + '\n').repeated(1048) + QByteArray(139, 'q') + '\n';
        const QString pads =
            (QStringList(1048, QString(249, u'p')) << QString(139, u'q')).join(u'|');
        row("a line ending with the read", {pad + "Ann\nBo"}, pads + u"|Ann|Bo"_s);
        row("a name across reads", {pad + "Annabel\nBo"}, pads + u"|Annabel|Bo"_s);
        row("CR LF across reads", {pad + "Ann\r\nBo"}, pads + u"|Ann|Bo"_s);
        row("3 bytes across reads", {pad + "Zo\u20AC\n"}, pads + u"|Zo\u20AC"_s);
        row("4 bytes across reads", {pad + "Zo\U0001F600\n"}, pads + u"|Zo\U0001F600"_s);
        row("a character cut by the end", {"Ann\nZo\xC3"}, u"Ann|Zo\uFFFD"_s);
        row("nothing but a cut character", {"\xC3"}, u"\uFFFD"_s);
        row("a NUL past the start", {start + QByteArray("B\0o\n", 4)},
            (QStringList(17000, u"Ann"_s) << u"Bo"_s).join(u'|'));
        // A read that fails ends the file: the names read before it stay,
        // the one it cut is not stored.
        const QStringList unread{errorReportText(
            u"The file %1/0.txt could not be read to its end: Input/output error"_s, at, 40, Long)};
        row("a read error at the start", {"Ann\nBo\n"}, u""_s, unread, {}, 1);
        row("a read error mid-file", {pad + "Ann\nBo\nCy"}, pads + u"|Ann"_s, unread, {}, 2);
        row("a read error cutting a name", {pad + "Annabel\nBo"}, pads, unread, {}, 2);
        // 255 characters (UTF-16 code units) at most, however many bytes.
        const auto longest = [&](const QString& name) {
            return refused(u"The name \"%1...\" is longer than 255 characters and was not "
                           u"stored."_s.arg(name.left(40)));
        };
        const QString x254(254, u'x'), e255(255, u'\u00EB'), e256(256, u'\u00EB');
        const QString emoji127 = QString(u"\U0001F600"_s).repeated(127);
        row("254, 255 and 256 characters",
            {(x254 + u"\n"_s + x254 + u"y\n"_s + x254 + u"yz\nBo"_s).toUtf8()},
            x254 + u'|' + x254 + u"y|Bo"_s, {longest(x254)});
        row("255 and 256 two-byte characters", {(e255 + u'\n' + e256).toUtf8()}, e255,
            {longest(e256)});
        row("255 code units in 128 characters", {(u"a"_s + emoji127 + u"\nBo"_s).toUtf8()},
            u"a"_s + emoji127 + u"|Bo"_s);
        row("256 code units", {(emoji127 + u"\U0001F600"_s).toUtf8()}, u""_s,
            {longest(emoji127.left(40))});
        row("255 after the apostrophes", {(x254 + u"'y'\n"_s).toUtf8()}, x254 + u'y');
        // Ten reports of refused names at most, then one of how many more.
        const QByteArray refuseBad =
            "create trigger refuse before insert on user_firstname when new.firstname = 'Bad' "
            "begin select raise(abort, 'no'); end";
        const auto bad = [](int count) -> QByteArray {
            return "Ann\n" + QByteArray("Bad\n").repeated(count) + "Cy";
        };
        const QStringList ten(10, refused(u"no"_s));
        const auto more = [&](const QString& text) {
            return ten + QStringList{errorReportText(text, at, 60, Long)};
        };
        const QString oneMore = u"1 more name of this file was not stored."_s;
        const QString fifteenMore = u"15 more names of this file were not stored."_s;
        row("9 refused", {bad(9)}, u"Ann|Cy"_s, ten.mid(1), refuseBad);
        row("10 refused", {bad(10)}, u"Ann|Cy"_s, ten, refuseBad);
        row("11 refused", {bad(11)}, u"Ann|Cy"_s, more(oneMore), refuseBad);
        row("25 refused", {bad(25)}, u"Ann|Cy"_s, more(fifteenMore), refuseBad);
        // A rule that undoes the whole transaction ends the import: nothing stays.
        row("a rule that rolls back", {"Ann\nBad\nCy"}, u""_s,
            {errorReportText(u"%1/names.mdb: no"_s, at, 50, Long)},
            QByteArray(refuseBad).replace("abort", "rollback"));
    }

    void importing()
    {
        QFETCH(QList<QByteArray>, files);
        QFETCH(QString, names);
        QFETCH(QStringList, reports);
        QFETCH(QByteArray, other);
        Rig rig(m_empty);
        sqlite3* second = nullptr;
        sqlite3_open(QFile::encodeName(rig.db).constData(), &second);
        QCOMPARE(sqlite3_exec(second, other.constData(), nullptr, nullptr, nullptr), SQLITE_OK);
        QStringList paths;
        for (const QByteArray& bytes : files) { // a null one is missing
            paths += rig.env.filePath(u"%1.txt"_s.arg(paths.size()));
            if (!bytes.isNull())
                writeBytes(paths.last(), bytes);
        }
        rig.env.dialogs.answerOpen(paths);
        QFETCH(int, failingRead);
        struct stat info {};
        FaultyRead::file =
            failingRead && ::stat(QFile::encodeName(paths[0]).constData(), &info) == 0 ? info.st_ino
                                                                                       : 0;
        FaultyRead::readsToFail = failingRead;
        rig.editor.PushButton6_Click();
        FaultyRead::file = 0;
        sqlite3_close(second);

        const QStringList stored = rig.firstNames();
        QCOMPARE(stored.join(u'|'), names.isNull() ? storable(files[0]).join(u'|') : names);
        const QStringList messages = rig.env.dialogs.messages();
        if (names.isNull())
            QVERIFY(messages.size() <= ListEditor::MaxReportsPerFile + 1);
        else
            QCOMPARE(messages, reports.replaceInStrings(u"%1"_s, rig.env.folder()));
        // The hourglass over the whole import, then once more over the one refresh.
        const QList<int> busy{MousePointer::Hourglass, MousePointer::Default};
        QCOMPARE(rig.pointer.history, paths.isEmpty() ? QList<int>() : busy + busy);
        QCOMPARE(rig.lists.firstPane().count(), stored.size());
        // The database is whole, keeps its indexes, and the panes can be filled from it.
        QCOMPARE(tableColumn(rig.db, u"pragma_integrity_check"_s, u"*"_s), QStringList{u"ok"_s});
        QVERIFY(tableColumn(rig.db, u"sqlite_master"_s, u"name"_s)
                    .contains(u"user_firstname_firstname"_s));
        rig.lists.RefreshLists(rig.choice);
    }

    // What importNameFile tells its caller of a file or a database that
    // cannot be opened, and of a choice with no list: nothing is stored.
    void problemsBeforeTheFirstName_data()
    {
        QTest::addColumn<QString>("path");  // in the test's folder, or absolute
        QTest::addColumn<bool>("database"); // there is one
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QStringList>("problems"); // step, culprit: description
        const auto row = [](const char* tag, const QString& path, const QString& problem,
                            bool database = true, ListChoice choice = User) {
            QTest::newRow(tag) << path << database << choice
                               << (problem.isEmpty() ? QStringList() : QStringList{problem});
        };
        const QString notAFile = u"2 1: %1/%2 is not a file that names can be read from."_s;
        row("missing", u"missing.txt"_s, u"0 1: File not found"_s);
        row("a folder", u"folder"_s, notAFile.arg(u"%1"_s, u"folder"_s));
        row("a FIFO", u"fifo"_s, notAFile.arg(u"%1"_s, u"fifo"_s));
        // Write-only, even for root.
        row("unreadable", u"/proc/sys/vm/drop_caches"_s,
            u"2 1: The file /proc/sys/vm/drop_caches cannot be read: Permission denied"_s);
        row("no database", u"names.txt"_s, u"1 2: %1/names.mdb: unable to open database file"_s,
            false);
        row("no list chosen", u"names.txt"_s, {}, true, ListChoice{.builtIn = false});
    }

    void problemsBeforeTheFirstName()
    {
        QFETCH(QString, path);
        QFETCH(bool, database);
        QFETCH(ListChoice, choice);
        QFETCH(QStringList, problems);
        if (QDir::isAbsolutePath(path) && !QFileInfo::exists(path))
            QSKIP("This system has no such file.");
        TestEnvironment env(database);
        QVERIFY(QDir(env.folder()).mkdir(u"folder"_s));
        QVERIFY(::mkfifo(QFile::encodeName(env.filePath(u"fifo"_s)).constData(), 0600) == 0);
        writeBytes(env.filePath(u"names.txt"_s), "Ann\n");
        std::optional<Connection> connection;
        QStringList heard;
        importNameFile([&]() -> Connection& { return connection.emplace(env.databasePath()); },
                       QDir(env.folder()).filePath(path), ListKind::FirstNames, choice,
                       [&](const ImportProblem& problem) {
                           heard += u"%1 %2: %3"_s.arg(int(problem.step))
                                        .arg(int(problem.culprit))
                                        .arg(problem.description);
                       });
        QCOMPARE(heard, problems.replaceInStrings(u"%1"_s, env.folder()));
        connection.reset();
        QVERIFY(!database
                || tableColumn(env.databasePath(), u"user_firstname"_s, u"*"_s).isEmpty());
    }

    // Every write of a small import, a clear and a delete fails in turn, as
    // SQLite's own tests fail them, or the disk is full at that write, or the
    // database is read-only: the operation is reported once, naming the
    // database and what failed, and the database holds what it held before
    // and is whole.
    void aFailingWriteLosesNothing_data()
    {
        QTest::addColumn<int>("button"); // 6 imports, 2 adds, 4 clears or deletes first names
        QTest::addColumn<ListChoice>("choice");
        QTest::addColumn<QStringList>("after"); // the first names when nothing fails
        QTest::addColumn<QString>("fault");     // the report's, after the database's name
        const ListChoice both{true, false, true, false, false};
        const QStringList imported{u"Old"_s, u"Ann"_s, u"Bo"_s, u"Cy"_s};
        const QString io = u"disk I/O error"_s;
        QTest::newRow("import") << 6 << User << imported << io;
        QTest::newRow("add") << 2 << User << QStringList{u"Old"_s, u"Ann"_s} << io;
        QTest::newRow("clear") << 4 << User << QStringList{} << io;
        QTest::newRow("delete") << 4 << both << QStringList{} << io;
        QTest::newRow("import, disk full") << 6 << User << imported << Full;
        QTest::newRow("import, read-only") << 6 << User << imported << ReadOnly;
    }

    void aFailingWriteLosesNothing()
    {
        QFETCH(int, button);
        QFETCH(ListChoice, choice);
        QFETCH(QStringList, after);
        QFETCH(QString, fault);
        FaultyDisk::install();
        const QString table = choice.user ? u"user_firstname"_s : u"system_ffirstname"_s;
        const QString male = u"system_mfirstname"_s;
        QTemporaryDir folder;
        const QString original = folder.filePath(u"names.mdb"_s);
        createEmptyDatabase(original);
        insertRows(original, table, choice.user ? u"firstname"_s : u"Ffirst"_s, {u"Old"_s});
        insertRows(original, male, u"Mfirst"_s, {u"Old"_s});
        const QStringList before = tableColumn(original, table, u"*"_s);
        int write = 1;
        for (;; ++write) {
            QVERIFY(write < 500);
            Rig rig(original);
            rig.choice = choice;
            rig.lists.RefreshLists(choice);
            const QString file = rig.env.filePath(u"names.txt"_s);
            writeBytes(file, "Ann\nBo\nCy\n");
            rig.env.dialogs.answerOpen({file});
            rig.env.dialogs.answerInput(u"Ann"_s);

            FaultyDisk::failed = false;
            // Read-only: the first pass only.
            FaultyDisk::readOnly = fault == ReadOnly && write == 1;
            FaultyDisk::writesToFail = fault == ReadOnly ? 0 : write;
            FaultyDisk::failWith = fault == Full ? SQLITE_FULL : SQLITE_IOERR_WRITE;
            if (button == 2)
                rig.editor.PushButton2_Click();
            else
                button == 6 ? rig.editor.PushButton6_Click() : rig.editor.PushButton4_Click(0);
            FaultyDisk::writesToFail = 0;
            FaultyDisk::readOnly = false;

            const QStringList messages = rig.env.dialogs.messages();
            const QStringList names = tableColumn(rig.db, table, u"*"_s);
            QCOMPARE(tableColumn(rig.db, u"pragma_integrity_check"_s, u"*"_s),
                     QStringList{u"ok"_s});
            if (!FaultyDisk::failed) {
                QVERIFY2(messages.isEmpty(), qPrintable(messages.join(u'\n')));
                QCOMPARE(names, after);
                break;
            }
            QCOMPARE(messages.size(), 1);
            QVERIFY2(messages[0].startsWith(rig.db + u": "_s + fault), qPrintable(messages[0]));
            QCOMPARE(names, before);
            QCOMPARE(tableColumn(rig.db, male, u"*"_s), QStringList{u"Old"_s});
        }
        QVERIFY(write > 1); // there was a fault
    }

    // A file of 4 MiB or more has its names stored while the list's indexes
    // are dropped, and the indexes built again at the end: either way the
    // same names are stored and the same indexes are there afterwards. An
    // index of another program's function shows which way was taken: a
    // smaller file cannot begin, a larger one cannot build it again; either
    // way nothing is stored.
    void largeFilesKeepTheIndexes_data()
    {
        QTest::addColumn<qint64>("size");
        QTest::addColumn<int>("button"); // 6 first names, 7 last names
        QTest::addColumn<bool>("user");
        // Another index of the list: of a function of another program's, or
        // unique (the file then starts with the name already there).
        QTest::addColumn<QString>("index");
        QTest::addColumn<int>("failedStep"); // the one report's; 0: none
        const qint64 bulk = 4 << 20;
        const QString none, quill = u"quill"_s, unique = u"unique"_s;
        QTest::newRow("at") << bulk << 6 << true << none << 0;
        QTest::newRow("above, built-in first names") << bulk + 1 << 6 << false << none << 0;
        QTest::newRow("at, built-in last names") << bulk << 7 << false << none << 0;
        QTest::newRow("at, user last names") << bulk << 7 << true << none << 0;
        QTest::newRow("below: no insert can begin") << bulk - 1 << 6 << true << quill << 30;
        QTest::newRow("at: the rebuild fails") << bulk << 6 << true << quill << 70;
        QTest::newRow("at: a unique index stays") << bulk << 6 << true << unique << 50;
    }

    void largeFilesKeepTheIndexes()
    {
        QFETCH(qint64, size);
        QFETCH(int, button);
        QFETCH(bool, user);
        QFETCH(QString, index);
        QFETCH(int, failedStep);
        const int list = (user ? 3 : 1) + (button == 7); // index into DatabaseTables
        const QString table = DatabaseTables[list], column = DatabaseColumns[list];
        Rig rig(m_empty);
        rig.choice = ListChoice{!user, user, true, false, false};
        const QString& db = rig.db;
        insertRows(db, table, column, {u"Old"_s});
        if (!index.isEmpty()) {
            Connection other(db);
            sqlite3_create_function_v2(
                other.handle(), "quill", 1, SQLITE_UTF8 | SQLITE_DETERMINISTIC, nullptr,
                [](sqlite3_context* c, int, sqlite3_value** v) { sqlite3_result_value(c, v[0]); },
                nullptr, nullptr, nullptr);
            other.execute((index == u"quill" ? u"create index quill on %1 (quill(%2))"_s
                                             : u"create unique index once on %1 (%2)"_s)
                              .arg(table, column)
                              .toUtf8()
                              .constData());
        }
        const auto schema = [&] {
            QStringList entries = tableColumn(db, u"sqlite_master"_s, u"name || ifnull(sql, '')"_s);
            entries.sort();
            return entries;
        };
        const QStringList before = schema();
        // Lines of 250 bytes, the last one shorter.
        QByteArray bytes = index == u"unique" ? "Old\n" : "";
        QStringList names{u"Old"_s};
        while (bytes.size() < size) {
            const qint64 left = size - bytes.size();
            const qint64 line = left >= 500 ? 250 : left >= 250 ? left / 2 : left;
            names += u"Name%1"_s.arg(names.size()).leftJustified(int(line) - 1, u'x');
            bytes += names.last().toLatin1() + '\n';
        }
        QCOMPARE(bytes.size(), size);
        writeBytes(rig.env.filePath(u"names.txt"_s), bytes);
        rig.env.dialogs.answerOpen({rig.env.filePath(u"names.txt"_s)});
        button == 6 ? rig.editor.PushButton6_Click() : rig.editor.PushButton7_Click();

        const QStringList messages = rig.env.dialogs.messages();
        QCOMPARE(messages.size(), failedStep ? 1 : 0);
        if (failedStep) {
            QVERIFY2(messages[0].contains(index == u"quill" ? u"function: quill"_s
                                                            : u"UNIQUE constraint failed"_s),
                     qPrintable(messages[0]));
            QVERIFY(messages[0].endsWith(errorReportText({}, u"in Tessmark.Main.FileToListview "_s,
                                                         failedStep, ClosingLine::Long)));
        }
        if (index != u"quill") // another program's function is needed to check that index
            QCOMPARE(tableColumn(db, u"pragma_integrity_check"_s, u"*"_s), QStringList{u"ok"_s});
        QCOMPARE(tableColumn(db, table, column), index == u"quill" ? QStringList{u"Old"_s} : names);
        QCOMPARE(schema(), before);
    }

    // A full disk met for real, not injected: a small file system of the
    // test's own where the tests run as root, else a limit on the size of
    // the files this process writes. The import ends with one report that
    // names the database, and nothing of the file is stored.
    void aFullDiskEndsTheImport()
    {
        TestEnvironment env(false);
        const QString disk = env.filePath(u"disk"_s);
        QVERIFY(QDir().mkpath(disk));
        const bool mounted = geteuid() == 0
                             && QProcess::execute(u"mount"_s, {u"-t"_s, u"tmpfs"_s, u"-o"_s,
                                                               u"size=256k"_s, u"tmpfs"_s, disk})
                                    == 0;
        const auto unmount = qScopeGuard([&] {
            if (mounted)
                QProcess::execute(u"umount"_s, {disk});
        });
        const QString db = disk + u"/names.mdb"_s;
        createEmptyDatabase(db);
        QByteArray names;
        for (int i = 0; i < 40000; ++i)
            names += "Quillon" + QByteArray::number(i) + '\n';
        writeBytes(env.filePath(u"names.txt"_s), names);
        FakePointer pointer;
        NameLists lists(db);
        ListEditor editor(env.dialogs, db, lists, pointer, [] {
            return ListChoice{false, true, true, false, false};
        });
        env.dialogs.answerOpen({env.filePath(u"names.txt"_s)});

        rlimit limit{};
        getrlimit(RLIMIT_FSIZE, &limit);
        const rlimit unlimited = limit;
        if (!mounted) {
            std::signal(SIGXFSZ, SIG_IGN);
            limit.rlim_cur = QFileInfo(db).size() + 64 * 1024;
            QCOMPARE(setrlimit(RLIMIT_FSIZE, &limit), 0);
        }
        editor.PushButton6_Click();
        setrlimit(RLIMIT_FSIZE, &unlimited);

        const QStringList messages = env.dialogs.messages();
        QCOMPARE(messages.size(), 1);
        // The system says the disk is full, or that the file grew too large.
        QVERIFY2(messages[0].startsWith(db + (mounted ? u": database or disk is full"_s : u": "_s)),
                 qPrintable(messages[0]));
        QVERIFY(tableColumn(db, u"user_firstname"_s, u"*"_s).isEmpty());
        QCOMPARE(tableColumn(db, u"pragma_integrity_check"_s, u"*"_s), QStringList{u"ok"_s});
    }
};

QTEST_MAIN(TestImport)
#include "tst_import.moc"