// The command-line companion as a script sees it: the real executable run
// as a child process over a copy of the shipped database, its exit status,
// its standard output and error, the files it writes, and what a failed run
// leaves behind.
#include "app/form2.h"
#include "names/database.h"
#include "support/controls.h"
#include "support/program.h"
#include "support/workbook.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QRegularExpression>
#include <QStandardPaths>

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

extern char** environ;

using namespace Qt::StringLiterals;

namespace {

struct Run {
    int status;
    QByteArray out;
    QByteArray err;
};

const QString Cli = QStringLiteral(QUILLANE_CLI);

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
    for (const QByteArray& line : printed.trimmed().split('\n')) {
        QStringList& row = rows.emplace_back();
        for (const QJsonValue& value : QJsonDocument::fromJson(line).array())
            row.append(value.toString());
    }
    return rows;
}

// A command line split at spaces.
QStringList words(const char* line)
{
    return QString::fromUtf8(line).split(u' ');
}

// A row of commandLines, tagged with its command line unless a tag is given.
void row(const char* tag, const char* line, int status, const char* said)
{
    QTest::newRow(tag) << words(line) << status << QString::fromUtf8(said);
}

void row(const char* line, int status, const char* said)
{
    row(line, line, status, said);
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

    // Runs quillane-cli on the test's database, unless the arguments name
    // one, and as a shell would take them: a first LC_ALL=LOCALE is the
    // user's number format (else C), a last >FILE receives standard output.
    Run run(QStringList arguments)
    {
        QProcess process;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert(u"LC_ALL"_s, arguments.value(0).startsWith(u"LC_ALL=")
                                            ? arguments.takeFirst().mid(7)
                                            : u"C.UTF-8"_s);
        process.setProcessEnvironment(environment);
        if (arguments.value(arguments.size() - 1).startsWith(u'>'))
            process.setStandardOutputFile(arguments.takeLast().mid(1));
        if (!arguments.isEmpty() && std::ranges::none_of(arguments, [](const QString& argument) {
                return argument.startsWith(u"--database");
            }))
            arguments.insert(1, u"--database=%1"_s.arg(db));
        process.start(Cli, arguments);
        process.waitForFinished(60000);
        return {process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1,
                process.readAllStandardOutput(), process.readAllStandardError()};
    }

private Q_SLOTS:
    void init()
    {
        env = std::make_unique<TestEnvironment>();
        db = env->databasePath();
    }

    // Every rule of the command line, one row each: a failure is one line on
    // standard error (ending in the way to the help for a usage error) and
    // nothing written; a success writes nothing there. Either way the
    // database and an existing output file are untouched. The rows tagged
    // "locked" run while another connection holds the database.
    void commandLines_data()
    {
        QTest::addColumn<QStringList>("arguments"); // %1 the test's folder
        QTest::addColumn<int>("status");
        // A failure: the start of its line after "quillane-cli: ". A success:
        // a pattern for all it wrote, to standard output and to a new file.
        QTest::addColumn<QString>("said");
        QTest::newRow("no command") << QStringList{} << 2 << u"Give a command."_s;
        row("make", 2, "'make' is not a command.");
        row("--help make", 2, "'make' is not a command.");
        row("generate -n 3 --fast", 2, "Unknown option '--fast'.");
        row("generate -n 3 -x", 2, "Unknown option '-x'.");
        row("--fast names last", 2, "Unknown option '--fast'.");
        row("generate -n 3 --format", 2, "Missing value after '--format'.");
        row("--database", 2, "Missing value after '--database'.");
        row("generate -n 3 --unique=yes", 2, "Unexpected value after '--unique'.");
        row("generate -n 3 stray", 2, "Unexpected argument 'stray'.");
        row("names first last extra", 2, "Unexpected argument 'last'.");
        row("generate --help extra", 2, "Unexpected argument 'extra'.");
        row("--version extra", 2, "Unexpected argument 'extra'.");
        row("add first", 2, "Too few arguments.");
        row("names First", 2, "Say 'first' or 'last', not 'First'.");
        row("generate -n 3 --count=4", 2, "--count is given more than once.");
        row("generate -n 3 --unique --unique", 2, "--unique is given more than once.");
        row("--database=%1/names.mdb generate -n 3 --database %1/names.mdb", 2,
            "--database is given more than once.");
        row("--database=%1/names.mdb --database %1/names.mdb names last", 2,
            "--database is given more than once.");
        row("-h --help", 2, "--help is given more than once.");
        row("--version --version", 2, "--version is given more than once.");
        row("--database= names last", 2, "--database needs a file name.");
        row("names last --database=", 2, "--database needs a file name.");
        row("generate -n 3 -o=", 2, "-o needs a file name, or '-' for standard output.");
        row("generate", 2, "How many? Give -n COUNT.");
        row("generate -n ten", 2, "How many does not appear to be a number.");
        row("generate -n -1e308", 2, "-n takes a count of 0 or more, not '-1e308'.");
        row("generate -n 1e19", 2, "-n takes at most 9223372036854775807 names, not '1e19'.");
        row("generate --count 1048577 -o %1/out.xlsx", 2, "A worksheet holds at most 1048576 rows");
        row("generate -n 3 --shard 1/2 -o %1/out.xlsx", 2,
            "A workbook is one file: it cannot be made in shards.");
        row("generate -n 3 --shard 3/2", 2,
            "--shard takes I/N, part I of N, with 1 <= I <= N, not '3/2'.");
        row("generate -n 3 --threads 0", 2,
            "--threads takes a whole number from 1 to 1024, not '0'.");
        row("names last --list mine", 2, "--list is 'builtin' or 'user', not 'mine'.");
        row("names first --gender all", 2, "--gender is 'both', 'male' or 'female', not 'all'.");
        row("generate -n 3 --seed x", 2, "--seed takes a whole number from 0");
        row("generate -n 3 --seed -1", 2, "--seed takes a whole number from 0");
        row("generate -n 3 --seed +1", 2, "--seed takes a whole number from 0");
        row("generate -n 3 --shard half", 2, "--shard takes I/N");
        row("generate -n 3 --shard 0/2", 2, "--shard takes I/N");
        row("generate -n 3 --threads x", 2,
            "--threads takes a whole number from 1 to 1024, not 'x'.");
        row("generate -n 3 --threads 1025", 2,
            "--threads takes a whole number from 1 to 1024, not '1025'.");
        row("generate -n 3 --format pdf", 2,
            "--format is text, lines, csv, tsv, jsonl, sql, xlsx2 or xlsx1, not 'pdf'.");
        row("generate -n 3 --format sql --table=", 2, "--table needs a name.");
        row("generate -n 3 -o %1/out.xlsx --table t", 2,
            "--table names the table of the sql format.");
        row("generate -n 3 --table t --format csv", 2,
            "--table names the table of the sql format.");
        row("generate -n 3 --format xlsx1", 2, "A workbook is written to a file: give -o FILE.");
        row("names first --list user --gender male", 2,
            "--gender chooses among the built-in first names; your own list has no genders.");
        row("delete first Ann --list user", 2,
            "Your own list is emptied as a whole: use 'quillane-cli clear'.");
        row("generate -n 3 -o %1/./names.mdb", 2,
            "-o %1/./names.mdb would replace the names database.");
        row("--database=%1/none.mdb names last", 1, "%1/none.mdb: unable to open database file");
        row("names last --database %1/good.txt", 1,
            "The file %1/good.txt is not a Quillane names database.");
        row("locked, reading", "generate -n 3", 1, "%1/names.mdb: database is locked");
        row("locked, adding", "add first Zed", 1, "%1/names.mdb: database is locked");
        row("generate -n 3 --list user -o %1/out.txt", 1, "You must add a first name");
        row("generate -n 3 --format xlsx2 -o %1", 1,
            "The file %1 could not be saved: Is a directory");
        QTest::newRow("blank name") << QStringList{u"add"_s, u"first"_s, u"Ann"_s, u"  "_s} << 1
                                    << u"The name \"  \" is blank: nothing was added."_s;
        row("control character", "add last Lee Evil\nInjected", 1,
            "The name \"Evil\\nInjected\" holds a control character and was not stored.");
        row("import last %1/good.txt %1/names.mdb", 1,
            "The file %1/names.mdb is not text: it holds control characters. Nothing of it was "
            "stored.");
        row("delete last SMITH Quillonne", 1,
            "\"Quillonne\" is not in the list: nothing was deleted.");
        row("import first %1/none.txt", 1, "File not found: %1/none.txt");
        QTest::newRow("a rejected name in the second file")
            << QStringList{u"import"_s, u"last"_s, u"%1/good.txt"_s, u"%1/bad.txt"_s} << 1
            << u"%1/bad.txt: The name \"%2...\" is longer than 255 characters and was not stored. "
               u"Nothing was imported."_s.arg(u"%1"_s, QString(40, u'x'));
        row("names last >/dev/full", 1, "standard output: No space left on device");
        row("generate -n 3000000 --threads 4 >/dev/full", 1,
            "standard output: No space left on device");
        row("generate -n 0", 0, "^\\z");
        row("LC_ALL=de_DE.UTF-8 generate -n 2,5", 0, "^(\\S+ \\S+\\n){2}\\z");
        // Beyond the window's bound, rounded: 1001 statements, the last of one.
        row("generate -n 1000000.6 --format sql", 0, "VALUES\\n\\([^\\n]*\\);\\n\\z");
        row("generate -n 2 --gender both", 0, "^(\\S+ \\S+\\n){2}\\z");
        row("generate -n 2 -o -", 0, "^(\\S+ \\S+\\n){2}\\z");
        row("generate -n 2 -o=%1/o.CSV", 0, "^first_name,last_name\\r\\n(\\S+,\\S+\\r\\n){2}\\z");
        row("generate -n 2 --output=%1/o.Tsv", 0,
            "^first_name\\tlast_name\\n(\\S+\\t\\S+\\n){2}\\z");
        row("generate -n 2 -o %1/o.JSONL", 0,
            "^(\\{\"first_name\":\"\\S+\",\"last_name\":\"\\S+\"\\}\\n){2}\\z");
        row("generate -n 2 -o%1/o.Sql", 0,
            "^INSERT INTO people \\(first_name, last_name\\) VALUES\\n");
        row("generate -n 2 -o %1/o.XLSX", 0, "^PK\\x03\\x04");
        row("generate -n 2 -o %1/o.lst", 0, "^(\\S+ \\S+\\r\\n){2}\\z");
        row("--help", 0, "^Usage: quillane-cli \\[--database FILE\\] COMMAND");
        row("--version", 0, "^quillane-cli \\d+\\.\\d+\\.\\d+\\nnames database: %1/");
        row("--help generate", 0, "^Usage: quillane-cli generate ");
        row("add first -h", 0, "^Usage: quillane-cli add ");
        for (const char* command : {"generate", "names", "add", "delete", "clear", "import"}) {
            QTest::addRow("%s --help", command)
                << QStringList{QString::fromUtf8(command), u"--help"_s} << 0
                << u"^Usage: quillane-cli %1 "_s.arg(QString::fromUtf8(command));
        }
    }

    void commandLines()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, status);
        QFETCH(QString, said);
        const QString folder = env->folder();
        writeBytes(env->filePath(u"good.txt"_s), "Quill\nStone\n");
        writeBytes(env->filePath(u"bad.txt"_s), "Reed\n" + QByteArray(256, 'x') + "\n");
        writeBytes(output(), "keep me\r\n");
        const QByteArray before = fileBytes(db);
        const QStringList files = QDir(folder).entryList(QDir::Files | QDir::Hidden);
        std::optional<Connection> lock;
        if (QByteArray(QTest::currentDataTag()).startsWith("locked")) {
            lock.emplace(db);
            lock->execute("begin exclusive");
        }
        const Run result = run(arguments.replaceInStrings(u"%1"_s, folder));
        lock.reset();
        QByteArray wrote = result.out;
        for (const QString& name : QDir(folder).entryList(QDir::Files | QDir::Hidden)) {
            if (!files.contains(name))
                wrote += fileBytes(env->filePath(name));
        }
        QCOMPARE(result.status, status);
        if (status == 0) {
            QCOMPARE(result.err, QByteArray());
            const QRegularExpression pattern(
                said.replace(u"%1"_s, QRegularExpression::escape(folder)));
            QVERIFY2(pattern.match(QString::fromLatin1(wrote)).hasMatch(),
                     wrote.left(300).constData());
        } else {
            QVERIFY2(wrote.isEmpty(), wrote.constData());
            const QStringList printed = lines(result.err);
            QCOMPARE(printed.size(), 1);
            QVERIFY2(
                printed.first().startsWith(u"quillane-cli: "_s + said.replace(u"%1"_s, folder)),
                result.err.constData());
            QCOMPARE(printed.first().contains(u" Try 'quillane-cli "_s), status == 2);
        }
        QCOMPARE(fileBytes(db), before);
        QCOMPARE(fileBytes(output()), QByteArray("keep me\r\n"));
    }

    // The window's results for seed 42, saved by its "Start Saving Results"
    // as a text file, are the companion's text output byte for byte; the
    // lines format, and the CSV and workbook files, hold the same rows.
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

        const QStringList generate = words("generate -n 2000 --seed 42") + choice;
        QCOMPARE(run(generate + words("--format text")).out, window);
        QCOMPARE(run(generate).out, QByteArray(window).replace("\r\n", "\n"));
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

    // The list commands change the lists as the window's buttons do, and
    // "names" prints a list as the window's pane shows it.
    void editsTheListsAsTheButtonsDo()
    {
        const QStringList user = words("--list user");
        QCOMPARE(run(QStringList{u"add"_s, u"first"_s, u"o'Neil"_s, u" Ann Lee "_s} + user).status,
                 0);
        QCOMPARE(run(QStringList{u"add"_s, u"last"_s, u"Quill, \"Jr\""_s} + user).status, 0);
        QCOMPARE(lines(run(words("names first --list user")).out),
                 (QStringList{u" Ann Lee "_s, u"oNeil"_s}));

        const QStringList files{env->filePath(u"a.txt"_s), env->filePath(u"b.txt"_s)};
        writeBytes(files[0], "Reed\r\nMoss\n\nFenwick");
        writeBytes(files[1], "\xEF\xBB\xBFHollin\n");
        QCOMPARE(run(words("import last") + files + user).status, 0);
        QCOMPARE(
            tableColumn(db, u"user_lastname"_s, u"lastname"_s),
            (QStringList{u"Quill, \"Jr\""_s, u"Reed"_s, u"Moss"_s, u"Fenwick"_s, u"Hollin"_s}));

        QCOMPARE(run(words("clear last")).status, 0);
        QVERIFY(tableColumn(db, u"user_lastname"_s, u"lastname"_s).isEmpty());
        QCOMPARE(tableColumn(db, u"user_firstname"_s, u"firstname"_s).size(), 2);

        // A built-in first name leaves the tables its gender says.
        insertRows(db, u"system_mfirstname"_s, u"Mfirst"_s, {u"Quillon"_s, u"Tamsin"_s});
        insertRows(db, u"system_ffirstname"_s, u"Ffirst"_s, {u"Quillon"_s, u"Tamsin"_s});
        QCOMPARE(run(words("delete first quillon --gender male")).status, 0);
        QCOMPARE(run(words("delete first Tamsin")).status, 0);
        QCOMPARE(run(words("add first Quillane")).status, 0);
        const QStringList men = tableColumn(db, u"system_mfirstname"_s, u"Mfirst"_s);
        const QStringList women = tableColumn(db, u"system_ffirstname"_s, u"Ffirst"_s);
        QVERIFY(!men.contains(u"Quillon"_s) && !men.contains(u"Tamsin"_s));
        QVERIFY(!women.contains(u"Tamsin"_s));
        QCOMPARE(women.count(u"Quillon"_s), 1);
        QCOMPARE(women.count(u"Quillane"_s), 1);

        // The panes of the window after clicking "Male Only" are what
        // "names" prints.
        const auto form = loadedForm1(env->environment);
        control<QRadioButton>(*form, u"Option2"_s)->click();
        QCOMPARE(lines(run(words("names first --gender male")).out),
                 shownColumn(*form, u"ListView2"_s));
        QCOMPARE(lines(run(words("names last")).out), shownColumn(*form, u"ListView1"_s));
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

    // No two names alike, counted as printed: a list of three first names
    // and two last names, once their duplicates and the names that tidy
    // alike are gone, makes all six pairs and no seventh.
    void uniqueNamesAtTheEdge()
    {
        insertRows(db, u"user_firstname"_s, u"firstname"_s,
                   {u"ann"_s, u"Bob"_s, u"mary ann"_s, u"Maryann"_s, u"ANN"_s});
        insertRows(db, u"user_lastname"_s, u"lastname"_s, {u"Lee"_s, u"lee"_s, u"Moss"_s});
        QStringList names = lines(run(words("generate --unique --list user -n 6")).out);
        names.sort();
        QCOMPARE(names, (QStringList{u"Ann Lee"_s, u"Ann Moss"_s, u"Bob Lee"_s, u"Bob Moss"_s,
                                     u"Maryann Lee"_s, u"Maryann Moss"_s}));

        const Run tooMany = run(words("generate --unique --list user -n 7"));
        QVERIFY(tooMany.status == 1 && tooMany.out.isEmpty());
        QCOMPARE(tooMany.err, "quillane-cli: These lists make 6 different names: ask for at most "
                              "6, not 7.\n");
    }

    // With one seed, shards 1 to N one after another are the whole run, for
    // counts that N does not divide, with and without --unique; and the
    // thread count changes no byte.
    void shardsMakeTheWholeRun_data()
    {
        QTest::addColumn<QStringList>("options");
        QTest::newRow("lines") << words("-n 10");
        QTest::newRow("csv, unique") << words("-n 101 --format csv --unique");
        QTest::newRow("sql, unique") << words("-n 2500 --format sql --unique");
        QTest::newRow("tsv, several blocks") << words("-n 70001 --format tsv");
        QTest::newRow("jsonl, unique, several blocks") << words("-n 70001 --format jsonl --unique");
    }

    void shardsMakeTheWholeRun()
    {
        QFETCH(QStringList, options);
        const QStringList generate = words("generate --seed 5") + options;
        const Run whole = run(generate + words("--threads 1"));
        QCOMPARE(whole.status, 0);
        QCOMPARE(run(generate + words("--threads 4")).out, whole.out);
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
        QTest::addColumn<QStringList>("reader"); // the program and its arguments; %1 the file
        QTest::addColumn<QByteArray>("input");   // %1 the file
        const QString python = u"python3"_s;
        const QString csv =
            u"import csv, json, sys\n"
            u"rows = list(csv.reader(open(sys.argv[1], newline='', encoding='utf-8'), "
            u"delimiter=sys.argv[2]))\n"
            u"assert rows[0] == ['first_name', 'last_name'], rows[0]\n"
            u"for row in rows[1:]: print(json.dumps(row))\n"_s;
        QTest::newRow("csv") << u"names.csv"_s << QStringList{python, u"-c"_s, csv, u"%1"_s, u","_s}
                             << QByteArray();
        QTest::newRow("tsv") << u"names.TSV"_s
                             << QStringList{python, u"-c"_s, csv, u"%1"_s, u"\t"_s} << QByteArray();
        QTest::newRow("jsonl")
            << u"names.jsonl"_s
            << QStringList{python, u"-c"_s,
                           u"import json, sys\n"
                           u"for line in open(sys.argv[1], encoding='utf-8'):\n"
                           u"    row = json.loads(line)\n"
                           u"    assert list(row) == ['first_name', 'last_name'], row\n"
                           u"    print(json.dumps([row['first_name'], row['last_name']]))\n"_s,
                           u"%1"_s}
            << QByteArray();
        QTest::newRow("sql") << u"names.Sql"_s << QStringList{u"sqlite3"_s, u"-batch"_s}
                             << QByteArray("create table \"test people\" (first_name text, "
                                           "last_name text);\n"
                                           ".read '%1'\n"
                                           "select json_array(first_name, last_name) from "
                                           "\"test people\" order by rowid;\n");
    }

    void formatsLoadInOtherPrograms()
    {
        QFETCH(QString, file);
        QFETCH(QStringList, reader);
        QFETCH(QByteArray, input);
        const QString program = reader.takeFirst();
        if (QStandardPaths::findExecutable(program).isEmpty())
            QSKIP(qPrintable(program + u" is not installed"_s));
        insertRows(db, u"user_firstname"_s, u"firstname"_s,
                   {u"o\"hara"_s, u"back\\slash"_s, u"comma,jr"_s, u"tab\there"_s, u"zo\u00eb"_s,
                    u"d'arcy"_s, u"\u00c5SA"_s});
        insertRows(db, u"user_lastname"_s, u"lastname"_s,
                   {u"m\u00fcller"_s, u"semi;colon"_s, u"x\"y,z"_s, u"a\tb"_s, u"ends\\"_s});
        const QStringList generate = words("generate -n 35 --unique --list user --seed 11");
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
        process.start(program, reader.replaceInStrings(u"%1"_s, path));
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
        const QStringList database{u"--database"_s, db};
        const long few = peakKilobytes(database + words("generate -n 100000"));
        const long many = peakKilobytes(database + words("generate -n 5000000"));
        QVERIFY(few > 0 && many > 0);
        QVERIFY2(many < few + 16 * 1024, qPrintable(u"%1 kB, then %2 kB"_s.arg(few).arg(many)));
    }
};

QTEST_MAIN(TestCli)
#include "tst_cli.moc"
