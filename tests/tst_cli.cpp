// The command-line companion as a script sees it: the real executable run
// as a child process over a copy of the shipped database, its exit status,
// its standard output and error, the files it writes, and what a failed run
// leaves behind.
#include "app/form2.h"
#include "names/database.h"
#include "support/controls.h"
#include "support/program.h"
#include "support/workbook.h"

#include <QButtonGroup>
#include <QJsonArray>
#include <QJsonDocument>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QStandardPaths>
#include <QTableView>

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

extern char** environ;

using namespace Qt::StringLiterals;

namespace {

struct Run {
    int status = -1;
    QByteArray out;
    QByteArray err;
};

const QString Cli = QStringLiteral(QUILLANE_CLI);

// Runs quillane-cli with the arguments, in the user's number format locale.
Run cli(const QStringList& arguments, const QString& locale = u"C.UTF-8"_s)
{
    QProcess process;
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(u"LC_ALL"_s, locale);
    process.setProcessEnvironment(environment);
    process.start(Cli, arguments);
    process.waitForFinished(60000);
    Run run;
    run.status = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
    run.out = process.readAllStandardOutput();
    run.err = process.readAllStandardError();
    return run;
}

// The peak resident memory, in kB, of quillane-cli run with the arguments
// and its standard output thrown away; -1 when it did not end well.
long peakKilobytes(const QStringList& arguments)
{
    std::vector<QByteArray> bytes{QFile::encodeName(Cli)};
    for (const QString& argument : arguments)
        bytes.push_back(argument.toUtf8());
    std::vector<char*> argv;
    for (QByteArray& argument : bytes)
        argv.push_back(argument.data());
    argv.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    pid_t pid = 0;
    const int spawned = posix_spawn(&pid, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (spawned != 0)
        return -1;
    int status = 0;
    rusage usage{};
    wait4(pid, &status, 0, &usage);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0 ? usage.ru_maxrss : -1;
}

// Rows as another program read them back: one JSON array [first, last] a
// line.
QList<QStringList> readBack(const QByteArray& printed)
{
    QList<QStringList> rows;
    for (const QByteArray& line : printed.split('\n')) {
        if (line.isEmpty())
            continue;
        QStringList row;
        for (const QJsonValue& value : QJsonDocument::fromJson(line).array())
            row.append(value.toString());
        rows.append(row);
    }
    return rows;
}

QStringList lines(const QByteArray& bytes)
{
    return QString::fromUtf8(bytes).split(u'\n', Qt::SkipEmptyParts);
}

// The full names of a results text ("First Last" CR LF per row).
QStringList rowsOf(const QByteArray& text)
{
    return QString::fromUtf8(text).split(u"\r\n"_s, Qt::SkipEmptyParts);
}

} // namespace

class TestCli : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> env;
    QString db; // the copy of the shipped database every run works on
    QString output() const { return env->filePath(u"out.txt"_s); }

    // Runs the companion on the test's database.
    Run run(QStringList arguments, const QString& locale = u"C.UTF-8"_s)
    {
        if (!arguments.isEmpty() && arguments.first() != u"--database")
            arguments.insert(1, u"--database=%1"_s.arg(db));
        return cli(arguments, locale);
    }

private Q_SLOTS:
    void init()
    {
        env = std::make_unique<TestEnvironment>();
        db = env->databasePath();
    }

    // Every way a command line can go wrong: one line on standard error
    // (ending in the way to the help for a usage error), nothing on standard
    // output, and neither the database nor an existing output file touched.
    void badInputChangesNothing_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("status");
        QTest::addColumn<QString>("error"); // the first line, %1 the test's folder
        const QString tooLong(256, u'x');
        QTest::newRow("no command") << QStringList{} << 2 << u"quillane-cli: Give a command."_s;
        QTest::newRow("unknown command")
            << QStringList{u"make"_s} << 2 << u"quillane-cli: 'make' is not a command."_s;
        QTest::newRow("unknown option") << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"--fast"_s}
                                        << 2 << u"quillane-cli: Unknown option 'fast'."_s;
        QTest::newRow("no count") << QStringList{u"generate"_s} << 2
                                  << u"quillane-cli: How many? Give -n COUNT."_s;
        QTest::newRow("count not a number")
            << QStringList{u"generate"_s, u"-n"_s, u"ten"_s} << 2
            << u"quillane-cli: How many does not appear to be a number."_s;
        QTest::newRow("count below zero")
            << QStringList{u"generate"_s, u"-n"_s, u"-5"_s} << 2
            << u"quillane-cli: -n takes a count of 0 or more, not '-5'."_s;
        QTest::newRow("count far below zero")
            << QStringList{u"generate"_s, u"-n"_s, u"-1e308"_s} << 2
            << u"quillane-cli: -n takes a count of 0 or more, not '-1e308'."_s;
        QTest::newRow("count beyond 64 bits")
            << QStringList{u"generate"_s, u"-n"_s, u"1e19"_s} << 2
            << u"quillane-cli: -n takes at most 9223372036854775807 names, not '1e19'."_s;
        QTest::newRow("more rows than a sheet holds")
            << QStringList{u"generate"_s, u"--count"_s, u"1048577"_s, u"-o"_s, u"%1/out.xlsx"_s}
            << 2 << u"quillane-cli: A worksheet holds at most 1048576 rows"_s;
        QTest::newRow("a workbook in shards")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s,          u"--shard"_s,
                           u"1/2"_s,      u"-o"_s, u"%1/out.xlsx"_s}
            << 2 << u"quillane-cli: A workbook is one file: it cannot be made in shards."_s;
        QTest::newRow("shard beyond the shards")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"--shard"_s, u"3/2"_s} << 2
            << u"quillane-cli: --shard takes I/N, part I of N, with 1 <= I <= N, not '3/2'."_s;
        QTest::newRow("no threads")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"--threads"_s, u"0"_s} << 2
            << u"quillane-cli: --threads takes a whole number from 1 to 1024, not '0'."_s;
        QTest::newRow("a table for csv")
            << QStringList{u"generate"_s, u"-n"_s,       u"3"_s,  u"--table"_s,
                           u"t"_s,        u"--format"_s, u"csv"_s}
            << 2 << u"quillane-cli: --table names the table of the sql format."_s;
        QTest::newRow("workbook to standard output")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"--format"_s, u"xlsx1"_s} << 2
            << u"quillane-cli: A workbook is written to a file: give -o FILE."_s;
        QTest::newRow("gender of the user list")
            << QStringList{u"names"_s, u"first"_s, u"--list"_s, u"user"_s, u"--gender"_s, u"male"_s}
            << 2
            << u"quillane-cli: --gender chooses among the built-in first names; your own list "
               u"has no genders."_s;
        QTest::newRow("delete from the user list")
            << QStringList{u"delete"_s, u"first"_s, u"Ann"_s, u"--list"_s, u"user"_s} << 2
            << u"quillane-cli: Your own list is emptied as a whole: use 'quillane-cli clear'."_s;
        QTest::newRow("output over the database")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"-o"_s, u"%1/./names.mdb"_s} << 2
            << u"quillane-cli: -o %1/./names.mdb would replace the names database."_s;
        QTest::newRow("empty user list")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s,         u"--list"_s,
                           u"user"_s,     u"-o"_s, u"%1/out.txt"_s}
            << 1 << u"quillane-cli: You must add a first name"_s;
        QTest::newRow("output is a folder")
            << QStringList{u"generate"_s, u"-n"_s, u"3"_s, u"--format"_s,
                           u"xlsx2"_s,    u"-o"_s, u"%1"_s}
            << 1 << u"quillane-cli: The file %1 could not be saved: Is a directory"_s;
        QTest::newRow("blank name") << QStringList{u"add"_s, u"first"_s, u"Ann"_s, u"  "_s} << 1
                                    << u"quillane-cli: The name \"  \" is blank: nothing was "
                                       u"added."_s;
        QTest::newRow("name too long")
            << QStringList{u"add"_s, u"last"_s, u"Lee"_s, tooLong} << 1
            << u"quillane-cli: The name \"%1...\" is longer than 255 characters and was not "
               u"stored."_s.arg(tooLong.left(40));
        QTest::newRow("control character")
            << QStringList{u"add"_s, u"last"_s, u"Lee"_s, u"Evil\nInjected"_s} << 1
            << u"quillane-cli: The name \"Evil\\nInjected\" holds a control character and was "
               u"not stored."_s;
        QTest::newRow("a file that is not text")
            << QStringList{u"import"_s, u"last"_s, u"%1/good.txt"_s, u"%1/names.mdb"_s} << 1
            << u"quillane-cli: The file %1/names.mdb is not text: it holds control characters. "
               u"Nothing of it was stored."_s;
        QTest::newRow("name not in the list")
            << QStringList{u"delete"_s, u"last"_s, u"SMITH"_s, u"Quillonne"_s} << 1
            << u"quillane-cli: \"Quillonne\" is not in the list: nothing was deleted."_s;
        QTest::newRow("file not found") << QStringList{u"import"_s, u"first"_s, u"%1/none.txt"_s}
                                        << 1 << u"quillane-cli: File not found: %1/none.txt"_s;
        QTest::newRow("a rejected name in the second file")
            << QStringList{u"import"_s, u"last"_s, u"%1/good.txt"_s, u"%1/bad.txt"_s} << 1
            << u"quillane-cli: %1/bad.txt: The name \"%2...\" is longer than 255 characters "
               u"and was not stored. Nothing was imported."_s.arg(u"%1"_s, tooLong.left(40));
    }

    void badInputChangesNothing()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, status);
        QFETCH(QString, error);
        const QString folder = env->folder();
        writeBytes(env->filePath(u"good.txt"_s), "Quill\nStone\n");
        writeBytes(env->filePath(u"bad.txt"_s), "Reed\n" + QByteArray(256, 'x') + "\n");
        writeBytes(output(), "keep me\r\n");
        const QByteArray before = fileBytes(db);
        for (QString& argument : arguments)
            argument = argument.replace(u"%1"_s, folder);

        const Run result = run(arguments);
        QCOMPARE(result.status, status);
        QVERIFY2(result.out.isEmpty(), result.out.constData());
        const QStringList said = lines(result.err);
        QCOMPARE(said.size(), 1);
        QVERIFY2(said.first().startsWith(error.replace(u"%1"_s, folder)), result.err.constData());
        QCOMPARE(said.first().contains(u" Try 'quillane-cli "_s), status == 2);
        QCOMPARE(fileBytes(db), before);
        QCOMPARE(fileBytes(output()), QByteArray("keep me\r\n"));
        QCOMPARE(QDir(folder).entryList(QDir::Files | QDir::Hidden).size(), 4);
    }

    // A missing, a corrupt and a locked database: one line, status 1.
    void databaseFailures_data()
    {
        QTest::addColumn<QString>("problem");
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<QString>("error");
        const QStringList generate{u"generate"_s, u"-n"_s, u"3"_s};
        QTest::newRow("missing") << u"missing"_s << generate
                                 << u"%1: unable to open database file"_s;
        QTest::newRow("not a database") << u"corrupt"_s << QStringList{u"names"_s, u"last"_s}
                                        << u"The file %1 is not a Quillane names database."_s;
        QTest::newRow("locked, reading") << u"locked"_s << generate << u"%1: database is locked"_s;
        QTest::newRow("locked, adding")
            << u"locked"_s << QStringList{u"add"_s, u"first"_s, u"Zed"_s}
            << u"%1: database is locked"_s;
    }

    void databaseFailures()
    {
        QFETCH(QString, problem);
        QFETCH(QStringList, arguments);
        QFETCH(QString, error);
        std::optional<Connection> lock;
        if (problem == u"missing")
            QVERIFY(QFile::remove(db));
        else if (problem == u"corrupt")
            writeBytes(db, QByteArray(4096, 'q'));
        else {
            lock.emplace(db);
            lock->execute("begin exclusive");
        }
        const Run result = run(arguments);
        QCOMPARE(result.status, 1);
        QVERIFY(result.out.isEmpty());
        QCOMPARE(QString::fromUtf8(result.err), u"quillane-cli: %1\n"_s.arg(error.arg(db)));
        lock.reset();
        if (problem == u"locked")
            QCOMPARE(tableColumn(db, u"system_ffirstname"_s, u"Ffirst"_s).count(u"Zed"_s), 0);
    }

    // The window's results for seed 42, saved by its "Start Saving Results"
    // as a text file, are the companion's text output byte for byte, on
    // standard output and in a file; the other formats hold the same rows.
    void generatesTheWindowsNames_data()
    {
        QTest::addColumn<QString>("option"); // the window's gender option
        QTest::addColumn<QStringList>("choice");
        QTest::newRow("Both") << u"Option1"_s << QStringList{};
        QTest::newRow("Male Only") << u"Option2"_s << QStringList{u"--gender"_s, u"male"_s};
        QTest::newRow("Female Only") << u"Option3"_s << QStringList{u"--gender"_s, u"female"_s};
    }

    void generatesTheWindowsNames()
    {
        QFETCH(QString, option);
        QFETCH(QStringList, choice);
        const QString saved = env->filePath(u"window.txt"_s);
        {
            const auto form = loadedForm1(env->environment);
            control<QRadioButton>(*form, option)->click();
            env->random.seed(42);
            control<QLineEdit>(*form, u"Text1"_s)->setText(u"2000"_s);
            control<QPushButton>(*form, u"PushButton1"_s)->click();
            control<QRadioButton>(*form->resultsWindow(), u"Option4"_s)->click();
            env->dialogs.answerSave(saved);
            control<QPushButton>(*form->resultsWindow(), u"PushButton2"_s)->click();
            QVERIFY(env->dialogs.messages().isEmpty());
        }
        const QByteArray window = fileBytes(saved);
        QCOMPARE(rowsOf(window).size(), 2000);

        const QStringList generate =
            QStringList{u"generate"_s, u"-n"_s, u"2000"_s, u"--seed"_s, u"42"_s} + choice;
        QCOMPARE(run(generate + QStringList{u"--format"_s, u"text"_s}).out, window);
        QCOMPARE(run(generate + QStringList{u"-o"_s, output()}).status, 0);
        QCOMPARE(fileBytes(output()), window);

        const Run plain = run(generate);
        QCOMPARE(plain.status, 0);
        QCOMPARE(plain.out, QByteArray(window).replace("\r\n", "\n"));
        QVERIFY(plain.err.isEmpty());

        const QString csv = env->filePath(u"names.csv"_s);
        QCOMPARE(run(generate + QStringList{u"-o"_s, csv}).status, 0);
        QCOMPARE(fileBytes(csv), "first_name,last_name\r\n" + QByteArray(window).replace(' ', ','));

        SKIP_WITHOUT_WORKBOOK_READER();
        const QString book = env->filePath(u"names.xlsx"_s);
        QCOMPARE(run(generate + QStringList{u"--format"_s, u"xlsx1"_s, u"-o"_s, book}).status, 0);
        QStringList cells;
        const QStringList rows = rowsOf(window);
        for (qsizetype row = 0; row < rows.size(); ++row)
            cells.append(u"A%1 %2"_s.arg(row + 1).arg(rows.at(row)));
        QCOMPARE(readWorkbook(book), cells.join(u','));
    }

    // The count is read as the window reads it, in the user's number format.
    void readsTheCountAsTheWindowDoes_data()
    {
        QTest::addColumn<QString>("count");
        QTest::addColumn<QString>("locale");
        QTest::addColumn<int>("rows");
        QTest::newRow("plain") << u"25"_s << u"C.UTF-8"_s << 25;
        QTest::newRow("decimal comma") << u"3,5"_s << u"de_DE.UTF-8"_s << 4;
        QTest::newRow("none") << u"0"_s << u"C.UTF-8"_s << 0;
        QTest::newRow("beyond the window's bound") << u"1000000.6"_s << u"C.UTF-8"_s << 1000001;
    }

    void readsTheCountAsTheWindowDoes()
    {
        QFETCH(QString, count);
        QFETCH(QString, locale);
        const Run result = run({u"generate"_s, u"-n"_s, count}, locale);
        QCOMPARE(result.status, 0);
        QTEST(int(result.out.count('\n')), "rows");
    }

    void theSeedReplaysARun()
    {
        const QStringList generate{u"generate"_s, u"-n"_s, u"500"_s, u"--seed"_s};
        const Run first = run(generate + QStringList{u"7"_s});
        QCOMPARE(lines(first.out).size(), 500);
        QCOMPARE(run(generate + QStringList{u"7"_s}).out, first.out);
        QVERIFY(run(generate + QStringList{u"8"_s}).out != first.out);
    }

    // The list commands change the lists as the window's buttons do, and
    // "names" prints a list as the window's pane shows it.
    void editsTheListsAsTheButtonsDo()
    {
        QCOMPARE(
            run({u"add"_s, u"first"_s, u"o'Neil"_s, u" Ann Lee "_s, u"--list"_s, u"user"_s}).status,
            0);
        QCOMPARE(run({u"add"_s, u"last"_s, u"Quill, \"Jr\""_s, u"--list"_s, u"user"_s}).status, 0);
        QCOMPARE(lines(run({u"names"_s, u"first"_s, u"--list"_s, u"user"_s}).out),
                 (QStringList{u" Ann Lee "_s, u"oNeil"_s}));

        // Names that need quoting come back whole from the CSV.
        const Run csv = run({u"generate"_s, u"-n"_s, u"1"_s, u"--list"_s, u"user"_s, u"--format"_s,
                             u"csv"_s, u"--seed"_s, u"1"_s});
        QVERIFY2(csv.out == "first_name,last_name\r\nAnnlee,\"Quill,\"\"jr\"\"\"\r\n"
                     || csv.out == "first_name,last_name\r\nOneil,\"Quill,\"\"jr\"\"\"\r\n",
                 csv.out.constData());

        writeBytes(env->filePath(u"a.txt"_s), "Reed\r\nMoss\n\nFenwick");
        writeBytes(env->filePath(u"b.txt"_s), "\xEF\xBB\xBFHollin\n");
        QCOMPARE(run({u"import"_s, u"last"_s, env->filePath(u"a.txt"_s), env->filePath(u"b.txt"_s),
                      u"--list"_s, u"user"_s})
                     .status,
                 0);
        QCOMPARE(
            tableColumn(db, u"user_lastname"_s, u"lastname"_s),
            (QStringList{u"Quill, \"Jr\""_s, u"Reed"_s, u"Moss"_s, u"Fenwick"_s, u"Hollin"_s}));

        QCOMPARE(run({u"clear"_s, u"last"_s}).status, 0);
        QVERIFY(tableColumn(db, u"user_lastname"_s, u"lastname"_s).isEmpty());
        QCOMPARE(tableColumn(db, u"user_firstname"_s, u"firstname"_s).size(), 2);

        // A built-in first name leaves the tables its gender says.
        insertRows(db, u"system_mfirstname"_s, u"Mfirst"_s, {u"Quillon"_s, u"Tamsin"_s});
        insertRows(db, u"system_ffirstname"_s, u"Ffirst"_s, {u"Quillon"_s, u"Tamsin"_s});
        QCOMPARE(run({u"delete"_s, u"first"_s, u"quillon"_s, u"--gender"_s, u"male"_s}).status, 0);
        QCOMPARE(run({u"delete"_s, u"first"_s, u"Tamsin"_s}).status, 0);
        const auto count = [this](const QString& table, const QString& column,
                                  const QString& name) {
            return tableColumn(db, table, column).count(name);
        };
        QCOMPARE(count(u"system_mfirstname"_s, u"Mfirst"_s, u"Quillon"_s), 0);
        QCOMPARE(count(u"system_ffirstname"_s, u"Ffirst"_s, u"Quillon"_s), 1);
        QCOMPARE(count(u"system_mfirstname"_s, u"Mfirst"_s, u"Tamsin"_s), 0);
        QCOMPARE(count(u"system_ffirstname"_s, u"Ffirst"_s, u"Tamsin"_s), 0);
        QCOMPARE(run({u"add"_s, u"first"_s, u"Quillane"_s}).status, 0);
        QCOMPARE(count(u"system_ffirstname"_s, u"Ffirst"_s, u"Quillane"_s), 1);

        // The panes of the window after clicking "Male Only" are what
        // "names" prints.
        const auto form = loadedForm1(env->environment);
        control<QRadioButton>(*form, u"Option2"_s)->click();
        QCOMPARE(lines(run({u"names"_s, u"first"_s, u"--gender"_s, u"male"_s}).out),
                 shownColumn(*form, u"ListView2"_s));
        QCOMPARE(lines(run({u"names"_s, u"last"_s}).out), shownColumn(*form, u"ListView1"_s));
    }

    // Replacing an output file keeps its permissions, for a text and a
    // workbook alike, and leaves no temporary file behind.
    void replacesAnOutputFileWhole_data()
    {
        QTest::addColumn<QString>("name");
        QTest::newRow("text") << u"out.txt"_s;
        QTest::newRow("workbook") << u"out.xlsx"_s;
    }

    void replacesAnOutputFileWhole()
    {
        QFETCH(QString, name);
        const QString path = env->filePath(name);
        writeBytes(path, "old");
        const auto permissions = QFile::ReadOwner | QFile::WriteOwner | QFile::ReadGroup;
        QVERIFY(QFile::setPermissions(path, permissions));
        QCOMPARE(run({u"generate"_s, u"-n"_s, u"10"_s, u"-o"_s, path}).status, 0);
        QVERIFY(fileBytes(path) != "old");
        QCOMPARE(QFileInfo(path).permissions() & ~(QFile::ReadUser | QFile::WriteUser),
                 permissions);
        QCOMPARE(QDir(env->folder()).entryList(QDir::Files | QDir::Hidden).size(), 2);
    }

    void helpAndVersion_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<QString>("start");
        QTest::newRow("--help") << QStringList{u"--help"_s} << u"Usage: quillane-cli [--"_s;
        QTest::newRow("--version") << QStringList{u"--version"_s} << u"quillane-cli 1."_s;
        for (const QString& command :
             {u"generate"_s, u"names"_s, u"add"_s, u"delete"_s, u"clear"_s, u"import"_s}) {
            QTest::addRow("%s --help", qPrintable(command))
                << QStringList{command, u"--help"_s} << u"Usage: quillane-cli %1 "_s.arg(command);
        }
    }

    void helpAndVersion()
    {
        QFETCH(QStringList, arguments);
        QFETCH(QString, start);
        const Run result = cli(arguments);
        QCOMPARE(result.status, 0);
        QVERIFY(result.err.isEmpty());
        QVERIFY2(QString::fromUtf8(result.out).startsWith(start), result.out.constData());
    }

    // A list, and a stream cut off while its threads are still making rows.
    void aFullStandardOutputIsAFailure_data()
    {
        QTest::addColumn<QStringList>("command");
        QTest::newRow("names") << QStringList{u"names"_s, u"last"_s};
        QTest::newRow("generate on threads")
            << QStringList{u"generate"_s, u"-n"_s, u"3000000"_s, u"--threads"_s, u"4"_s};
    }

    void aFullStandardOutputIsAFailure()
    {
        QFETCH(QStringList, command);
        QProcess process;
        process.setStandardOutputFile(u"/dev/full"_s);
        process.start(Cli, QStringList{u"--database"_s, db} + command);
        QVERIFY(process.waitForFinished(60000));
        QCOMPARE(process.exitCode(), 1);
        QCOMPARE(process.readAllStandardError(),
                 QByteArray("quillane-cli: standard output: No space left on device\n"));
    }

    // No two names alike, counted as printed: a list of three first names
    // and two last names, once their duplicates and the names that tidy
    // alike are gone, makes all six pairs and no seventh.
    void uniqueNamesAtTheEdge()
    {
        insertRows(db, u"user_firstname"_s, u"firstname"_s,
                   {u"ann"_s, u"Bob"_s, u"mary ann"_s, u"Maryann"_s, u"ANN"_s});
        insertRows(db, u"user_lastname"_s, u"lastname"_s, {u"Lee"_s, u"lee"_s, u"Moss"_s});
        const QStringList generate{u"generate"_s, u"--unique"_s, u"--list"_s, u"user"_s, u"-n"_s};
        const Run all = run(generate + QStringList{u"6"_s});
        QCOMPARE(all.status, 0);
        QStringList names = lines(all.out);
        names.sort();
        QCOMPARE(names, (QStringList{u"Ann Lee"_s, u"Ann Moss"_s, u"Bob Lee"_s, u"Bob Moss"_s,
                                     u"Maryann Lee"_s, u"Maryann Moss"_s}));

        const Run tooMany = run(generate + QStringList{u"7"_s});
        QCOMPARE(tooMany.status, 1);
        QVERIFY(tooMany.out.isEmpty());
        QCOMPARE(tooMany.err, "quillane-cli: These lists make 6 different names: ask for at most "
                              "6, not 7.\n");
    }

    // With one seed, shards 1 to N one after another are the whole run, for
    // counts that N does not divide, with and without --unique; and the
    // thread count changes no byte.
    void shardsMakeTheWholeRun_data()
    {
        QTest::addColumn<QStringList>("options");
        QTest::newRow("lines") << QStringList{u"-n"_s, u"10"_s};
        QTest::newRow("csv, unique")
            << QStringList{u"-n"_s, u"101"_s, u"--format"_s, u"csv"_s, u"--unique"_s};
        QTest::newRow("sql, unique")
            << QStringList{u"-n"_s, u"2500"_s, u"--format"_s, u"sql"_s, u"--unique"_s};
        QTest::newRow("tsv, several blocks")
            << QStringList{u"-n"_s, u"70001"_s, u"--format"_s, u"tsv"_s};
        QTest::newRow("jsonl, unique, several blocks")
            << QStringList{u"-n"_s, u"70001"_s, u"--format"_s, u"jsonl"_s, u"--unique"_s};
    }

    void shardsMakeTheWholeRun()
    {
        QFETCH(QStringList, options);
        const QStringList generate = QStringList{u"generate"_s, u"--seed"_s, u"5"_s} + options;
        const Run whole = run(generate + QStringList{u"--threads"_s, u"1"_s});
        QCOMPARE(whole.status, 0);
        QCOMPARE(run(generate + QStringList{u"--threads"_s, u"4"_s}).out, whole.out);
        for (const int shards : {1, 2, 3, 7}) {
            QByteArray joined;
            for (int shard = 1; shard <= shards; ++shard) {
                const Run part =
                    run(generate + QStringList{u"--shard"_s, u"%1/%2"_s.arg(shard).arg(shards)});
                QCOMPARE(part.status, 0);
                joined += part.out;
            }
            QVERIFY2(joined == whole.out, qPrintable(u"%1 shards"_s.arg(shards)));
        }
    }

    // Each format loads in a program that reads it: Python's csv and json,
    // the sqlite3 shell. Quotes, backslashes, commas, tabs and letters
    // beyond ASCII come back as the lines format prints them. The file's
    // ending chooses the format, in any capitals.
    void formatsLoadInOtherPrograms_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QString>("reader");
        QTest::addColumn<QStringList>("arguments"); // %1 the file
        QTest::addColumn<QByteArray>("input");      // %1 the file
        const QString python = u"/usr/bin/python3"_s;
        const QString csv =
            u"import csv, json, sys\n"
            u"rows = list(csv.reader(open(sys.argv[1], newline='', encoding='utf-8'), "
            u"delimiter=sys.argv[2]))\n"
            u"assert rows[0] == ['first_name', 'last_name'], rows[0]\n"
            u"for row in rows[1:]: print(json.dumps(row))\n"_s;
        QTest::newRow("csv") << u"names.csv"_s << python
                             << QStringList{u"-c"_s, csv, u"%1"_s, u","_s} << QByteArray();
        QTest::newRow("tsv") << u"names.TSV"_s << python
                             << QStringList{u"-c"_s, csv, u"%1"_s, u"\t"_s} << QByteArray();
        QTest::newRow("jsonl")
            << u"names.jsonl"_s << python
            << QStringList{u"-c"_s,
                           u"import json, sys\n"
                           u"for line in open(sys.argv[1], encoding='utf-8'):\n"
                           u"    row = json.loads(line)\n"
                           u"    assert list(row) == ['first_name', 'last_name'], row\n"
                           u"    print(json.dumps([row['first_name'], row['last_name']]))\n"_s,
                           u"%1"_s}
            << QByteArray();
        QTest::newRow("sql") << u"names.Sql"_s << u"sqlite3"_s << QStringList{u"-batch"_s}
                             << QByteArray("create table \"test people\" (first_name text, "
                                           "last_name text);\n"
                                           ".read '%1'\n"
                                           "select json_array(first_name, last_name) from "
                                           "\"test people\" order by rowid;\n");
    }

    void formatsLoadInOtherPrograms()
    {
        QFETCH(QString, file);
        QFETCH(QString, reader);
        QFETCH(QStringList, arguments);
        QFETCH(QByteArray, input);
        if (QStandardPaths::findExecutable(reader).isEmpty())
            QSKIP(qPrintable(reader + u" is not installed"_s));
        insertRows(db, u"user_firstname"_s, u"firstname"_s,
                   {u"o\"hara"_s, u"back\\slash"_s, u"comma,jr"_s, u"tab\there"_s, u"zo\u00eb"_s,
                    u"d'arcy"_s, u"\u00c5SA"_s});
        insertRows(db, u"user_lastname"_s, u"lastname"_s,
                   {u"m\u00fcller"_s, u"semi;colon"_s, u"x\"y,z"_s, u"a\tb"_s, u"ends\\"_s});
        const QStringList generate{u"generate"_s, u"-n"_s,   u"35"_s,     u"--unique"_s,
                                   u"--list"_s,   u"user"_s, u"--seed"_s, u"11"_s};
        QList<QStringList> expected;
        for (const QString& line : lines(run(generate).out))
            expected.append({line.section(u' ', 0, 0), line.section(u' ', 1)});
        QCOMPARE(expected.size(), 35);

        const QString path = env->filePath(file);
        QStringList options{u"-o"_s, path};
        if (file.endsWith(u".Sql"_s))
            options << u"--table"_s << u"test people"_s;
        const Run written = run(generate + options);
        QCOMPARE(written.status, 0);
        QProcess process;
        process.start(reader, arguments.replaceInStrings(u"%1"_s, path));
        process.write(input.replace("%1", QFile::encodeName(path)));
        process.closeWriteChannel();
        QVERIFY(process.waitForFinished(60000));
        QVERIFY2(process.exitCode() == 0, process.readAllStandardError().constData());
        QCOMPARE(readBack(process.readAllStandardOutput()), expected);
    }

    // Memory does not grow with the count: fifty times the names, about the
    // same peak (a run that kept its rows would need 8 bytes a row more).
    void memoryDoesNotGrowWithTheCount()
    {
        const QStringList generate{u"--database"_s, db, u"generate"_s, u"-n"_s};
        const long few = peakKilobytes(generate + QStringList{u"100000"_s});
        const long many = peakKilobytes(generate + QStringList{u"5000000"_s});
        QVERIFY(few > 0 && many > 0);
        QVERIFY2(many < few + 16 * 1024, qPrintable(u"%1 kB, then %2 kB"_s.arg(few).arg(many)));
    }
};

QTEST_MAIN(TestCli)
#include "tst_cli.moc"
