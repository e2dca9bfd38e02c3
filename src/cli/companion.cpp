#include "cli/companion.h"

#include "base/clock.h"
#include "base/failure.h"
#include "base/programfiles.h"
#include "base/safefile.h"
#include "generate/generation.h"
#include "generate/namerun.h"
#include "generate/randomsource.h"
#include "names/database.h"
#include "names/listoperations.h"
#include "names/namelists.h"
#include "results/namestream.h"
#include "results/resultsfile.h"
#include "results/resultsmodel.h"
#include "results/spreadsheet.h"
#include "results/textfile.h"

#include <QCommandLineParser>
#include <QDir>
#include <QFileInfo>
#include <QLocale>
#include <QRegularExpression>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <functional>
#include <limits>
#include <map>
#include <optional>
#include <utility>
#include <variant>

using namespace Qt::StringLiterals;

namespace {

const QString Program = u"quillane-cli"_s;

// More threads than this buy nothing on any machine of today.
constexpr int MaxThreads = 1024;

// A command line that cannot be run as written; command names the
// subcommand whose help explains it, if any.
struct UsageProblem {
    QString message;
    QString command;
};

[[noreturn]] void usage(const QString& message, const QString& command = {})
{
    throw UsageProblem{message, command};
}

// An option that takes a value is a slip when given twice, and so, for one
// rule, is any other: none of them is quietly overridden.
[[noreturn]] void givenTwice(const QString& option, const QString& command = {})
{
    usage(u"%1 is given more than once."_s.arg(option), command);
}

const char GeneralHelp[] = R"(Usage: quillane-cli [--database FILE] COMMAND [OPTIONS]

Random personal names from Quillane's names database, for scripts, builds
and test data. The commands work on the same lists as the program's window.

Commands:
  generate   make random full names
  names      print the first or the last names of a list
  add        add names to a list
  delete     delete names from the built-in list
  clear      empty the first or the last names of your own list
  import     add the names of text files, one per line, to a list

Options:
  --database FILE  the names database (default: names.mdb beside the
                   program, or your own copy of it in
                   $XDG_DATA_HOME/quillane, ~/.local/share/quillane, where
                   the program's folder cannot be written)
  -h, --help       show this help
  --version        show the version and the names database in use

Run 'quillane-cli COMMAND --help' for the options of a command.
)";

const std::map<QString, const char*> CommandHelp = {
    {u"generate"_s, R"(Usage: quillane-cli generate -n COUNT [OPTIONS]

Makes COUNT random full names as the window's "Start Generating" does: for
each, a last name and a first name drawn from the chosen list, with spaces
removed and regular capitals. The names stream out as they are made, so any
count takes the same memory.

Options:
  -n, --count COUNT    how many names, 0 or more, in your number format
  --list builtin|user  draw from the built-in list (default) or your own
  --gender both|male|female
                       the built-in first names to draw from (default: both)
  --seed N             start the random source at N, a whole number from 0
                       to 18446744073709551615: the same seed gives the same
                       names (default: the time of day)
  --unique             no two names alike (first and last name as printed);
                       refused when the list makes fewer than COUNT
  --shard I/N          make only part I of N of the run: with the same seed,
                       parts 1 to N one after another are the whole run
  --threads N          make the names on N threads (default: every core);
                       the names do not depend on it
  --format FORMAT      text   "First Last" and CR LF per name: the window's
                              text file, byte for byte
                       lines  "First Last" and LF per name
                       csv    comma-separated, with the header line
                              first_name,last_name
                       tsv    tab-separated, with the header line
                              first_name<TAB>last_name
                       jsonl  {"first_name":...,"last_name":...} per line
                       sql    INSERT statements of up to 1000 names each
                       xlsx2  a workbook, first and last names in columns A, B
                       xlsx1  a workbook, full names in column A
                       (a workbook holds at most 1048576 names)
                       Without it: lines on standard output; with -o, the
                       format a FILE ending in .csv, .tsv, .jsonl, .sql or
                       .xlsx (xlsx2) names, else text.
  --table NAME         the table the sql format inserts into (default: people)
  -o, --output FILE    write to FILE instead of standard output ('-'); an
                       existing FILE is replaced only once the new one is
                       complete
  --database FILE      the names database
)"},
    {u"names"_s, R"(Usage: quillane-cli names first|last [OPTIONS]

Prints the first or the last names of a list, one per line, as the window's
panes show them.

Options:
  --list builtin|user  the built-in list (default) or your own
  --gender both|male|female
                       the built-in first names (default: both)
  --database FILE      the names database
)"},
    {u"add"_s, R"(Usage: quillane-cli add first|last NAME... [OPTIONS]

Adds names to a list as the window's "Add" buttons do: apostrophes are
removed and a name keeps its spaces. First names added to the built-in list
join its female names. All the names are added, or none.

Options:
  --list builtin|user  the built-in list (default) or your own
  --database FILE      the names database
)"},
    {u"delete"_s, R"(Usage: quillane-cli delete first|last NAME... [OPTIONS]

Deletes names from the built-in list as the window's "Delete" buttons do.
A first name leaves the male names, the female names or both, as --gender
says. Capitals do not matter. A name that is not in the list is an error,
and then nothing is deleted. Your own list is emptied as a whole with
'quillane-cli clear'.

Options:
  --gender both|male|female
                       which built-in first names to delete from
                       (default: both)
  --database FILE      the names database
)"},
    {u"clear"_s, R"(Usage: quillane-cli clear first|last [OPTIONS]

Deletes every first name or every last name of your own list, as the
window's "Clear" buttons do.

Options:
  --database FILE      the names database
)"},
    {u"import"_s, R"(Usage: quillane-cli import first|last FILE... [OPTIONS]

Adds the names of text files to a list as the window's "Load ... From File"
buttons do: one name per line, in UTF-8 (or UTF-16 or UTF-32 with a
byte-order mark; a file that is not UTF-8 is read as Windows-1252),
apostrophes removed, empty lines skipped. A name longer than 255 characters
or with a control character is refused, and so is a file that is not text;
then, or on any other failure, nothing of any file is imported.

Options:
  --list builtin|user  the built-in list (default) or your own
  --database FILE      the names database
)"},
};

// An output format of generate: a streamed one, or a workbook's layout.
using Format = std::variant<RowFormat, OutputChoice>;

const std::map<QString, Format> Formats = {
    {u"text"_s, RowFormat::Text},
    {u"lines"_s, RowFormat::Lines},
    {u"csv"_s, RowFormat::Csv},
    {u"tsv"_s, RowFormat::Tsv},
    {u"jsonl"_s, RowFormat::JsonLines},
    {u"sql"_s, RowFormat::Sql},
    {u"xlsx2"_s, OutputChoice::SpreadsheetTwoCells},
    {u"xlsx1"_s, OutputChoice::SpreadsheetOneCell},
};

// The format a file's name chooses, by its ending in any capitals.
Format formatOfFile(const QString& path)
{
    const std::pair<QString, Format> endings[] = {
        {u".csv"_s, RowFormat::Csv},
        {u".tsv"_s, RowFormat::Tsv},
        {u".jsonl"_s, RowFormat::JsonLines},
        {u".sql"_s, RowFormat::Sql},
        {u".xlsx"_s, OutputChoice::SpreadsheetTwoCells},
    };
    for (const auto& [ending, format] : endings) {
        if (path.endsWith(ending, Qt::CaseInsensitive))
            return format;
    }
    return RowFormat::Text;
}

// What the generate command was asked to do.
struct GenerateRequest {
    ListChoice list;
    std::optional<std::uint64_t> seed;
    RunOptions run;
    Format format = RowFormat::Lines;
    QString table = u"people"_s;
    int threads = 0; // every core
    QString output;  // empty: standard output
};

class Command {
public:
    // An empty database means the program's default, chosen only once the
    // command line asks for a command to run.
    Command(QString name, const QStringList& arguments, QString database, QString programFolder,
            std::FILE* out)
        : m_name(std::move(name))
        , m_arguments(arguments)
        , m_database(std::move(database))
        , m_programFolder(std::move(programFolder))
        , m_out(out)
    {
    }

    int run()
    {
        if (m_name == u"generate")
            return generate();
        if (m_name == u"names")
            return names();
        if (m_name == u"add")
            return add();
        if (m_name == u"delete")
            return remove();
        if (m_name == u"clear")
            return clear();
        if (m_name == u"import")
            return import();
        usage(u"'%1' is not a command."_s.arg(m_name));
    }

private:
    // The options every command takes, then the command's own. False when
    // the command's help was asked for: it is shown, and the command ends.
    // Help is shown for a command line still being typed, with too few
    // arguments, but not for one that could not run as written.
    bool parse(QList<QCommandLineOption> options, int leastPositional, int mostPositional)
    {
        options += {{u"database"_s, {}, u"FILE"_s}, {{u"h"_s, u"help"_s}, {}}};
        m_parser.addOptions(options);
        m_parser.setSingleDashWordOptionMode(QCommandLineParser::ParseAsCompactedShortOptions);
        if (!m_parser.parse(QStringList{Program} + m_arguments)) {
            const QStringList unknown = m_parser.unknownOptionNames();
            if (unknown.isEmpty())
                usage(m_parser.errorText(), m_name);
            // Written as typed: one letter after '-', a word after '--'.
            usage(u"Unknown option '%1%2'."_s.arg(unknown.first().size() == 1 ? u"-" : u"--",
                                                  unknown.first()),
                  m_name);
        }
        const QStringList found = m_parser.optionNames();
        for (const QCommandLineOption& option : options) {
            if (std::ranges::count_if(
                    found, [&](const QString& name) { return option.names().contains(name); })
                > 1)
                givenTwice(u"--"_s + option.names().last(), m_name);
        }
        const QStringList positional = m_parser.positionalArguments();
        if (mostPositional >= 0 && positional.size() > mostPositional)
            usage(u"Unexpected argument '%1'."_s.arg(positional.at(mostPositional)), m_name);
        if (m_parser.isSet(u"help"_s)) {
            write(QByteArray(CommandHelp.at(m_name)));
            return false;
        }
        if (positional.size() < leastPositional)
            usage(u"Too few arguments."_s, m_name);
        if (m_parser.isSet(u"database"_s)) {
            if (!m_database.isEmpty())
                givenTwice(u"--database"_s, m_name);
            m_database = m_parser.value(u"database"_s);
            if (m_database.isEmpty())
                usage(u"--database needs a file name."_s, m_name);
        }
        if (m_database.isEmpty())
            m_database = namesDatabaseInUse(m_programFolder);
        return true;
    }

    ListKind kind() const
    {
        const QString word = m_parser.positionalArguments().value(0);
        if (word == u"first")
            return ListKind::FirstNames;
        if (word == u"last")
            return ListKind::LastNames;
        usage(u"Say 'first' or 'last', not '%1'."_s.arg(word), m_name);
    }

    // The --list (and --gender) options as the window's option buttons
    // would be set.
    ListChoice choice(bool takesGender) const
    {
        ListChoice choice;
        const QString list = m_parser.value(u"list"_s);
        if (list == u"user") {
            choice.builtIn = false;
            choice.user = true;
        } else if (list != u"builtin") {
            usage(u"--list is 'builtin' or 'user', not '%1'."_s.arg(list), m_name);
        }
        if (takesGender && m_parser.isSet(u"gender"_s)) {
            if (choice.user)
                usage(u"--gender chooses among the built-in first names; your own list has "
                      u"no genders."_s,
                      m_name);
            const QString gender = m_parser.value(u"gender"_s);
            choice.both = gender == u"both";
            choice.male = gender == u"male";
            choice.female = gender == u"female";
            if (!choice.both && !choice.male && !choice.female)
                usage(u"--gender is 'both', 'male' or 'female', not '%1'."_s.arg(gender), m_name);
        }
        return choice;
    }

    static QCommandLineOption listOption() { return {u"list"_s, {}, u"LIST"_s, u"builtin"_s}; }
    static QCommandLineOption genderOption() { return {u"gender"_s, {}, u"GENDER"_s, u"both"_s}; }

    // Work over a connection of its own, in one transaction: all of it is
    // stored, or after any failure none of it.
    void inOneTransaction(const std::function<void(Connection&)>& work) const
    {
        Connection connection(m_database);
        Connection::Transaction transaction(connection);
        work(connection);
        transaction.commit();
    }

    // Both panes for the choice, filled as the window fills them.
    void fillPanes(NameLists& lists, const ListChoice& choice) const { lists.RefreshLists(choice); }

    // Bytes to standard output, flushed to the end when asked.
    void write(QByteArrayView bytes, bool flush = true) const
    {
        if ((!bytes.isEmpty()
             && std::fwrite(bytes.data(), 1, std::size_t(bytes.size()), m_out)
                    != std::size_t(bytes.size()))
            || (flush && std::fflush(m_out) != 0))
            throw Failure(
                u"standard output: %1"_s.arg(QString::fromLocal8Bit(std::strerror(errno))));
    }

    GenerateRequest readGenerate();
    int generate();
    int names();
    int add();
    int remove();
    int clear();
    int import();

    QString m_name;
    QStringList m_arguments;
    QString m_database;
    QString m_programFolder;
    std::FILE* m_out;
    QCommandLineParser m_parser;
};

GenerateRequest Command::readGenerate()
{
    GenerateRequest request;
    const auto value = [this](const QString& option) { return m_parser.value(option); };

    // The count is read as the window reads its count box, without its bound.
    if (!m_parser.isSet(u"count"_s))
        usage(u"How many? Give -n COUNT."_s, m_name);
    const CountText count(value(u"count"_s), QLocale::system());
    if (!count.isNumber())
        usage(GenerationMessages::NotANumber, m_name);
    if (count.value() < 0)
        usage(u"-n takes a count of 0 or more, not '%1'."_s.arg(value(u"count"_s)), m_name);
    const std::optional<std::int64_t> whole = count.wholeCount();
    if (!whole)
        usage(u"-n takes at most %1 names, not '%2'."_s.arg(
                  QString::number(std::numeric_limits<std::int64_t>::max()), value(u"count"_s)),
              m_name);
    request.run.count = *whole;
    request.run.unique = m_parser.isSet(u"unique"_s);
    request.list = choice(true);

    if (m_parser.isSet(u"seed"_s)) {
        bool ok = false;
        const QString text = value(u"seed"_s);
        const qulonglong seed = text.toULongLong(&ok);
        // The conversion refuses a minus sign but takes a plus.
        if (!ok || text.startsWith(u'+'))
            usage(u"--seed takes a whole number from 0 to 18446744073709551615, not '%1'."_s.arg(
                      text),
                  m_name);
        request.seed = seed;
    }

    if (m_parser.isSet(u"shard"_s)) {
        static const QRegularExpression form(u"^([0-9]{1,9})/([0-9]{1,9})$"_s);
        const QRegularExpressionMatch match = form.match(value(u"shard"_s));
        const int shard = match.hasMatch() ? match.captured(1).toInt() : 0;
        const int shards = match.hasMatch() ? match.captured(2).toInt() : 0;
        if (shard < 1 || shard > shards)
            usage(u"--shard takes I/N, part I of N, with 1 <= I <= N, not '%1'."_s.arg(
                      value(u"shard"_s)),
                  m_name);
        request.run.shard = shard;
        request.run.shards = shards;
    }

    if (m_parser.isSet(u"threads"_s)) {
        bool ok = false;
        request.threads = value(u"threads"_s).toInt(&ok);
        if (!ok || request.threads < 1 || request.threads > MaxThreads)
            usage(u"--threads takes a whole number from 1 to %1, not '%2'."_s.arg(
                      QString::number(MaxThreads), value(u"threads"_s)),
                  m_name);
    }

    request.output = value(u"output"_s);
    if (m_parser.isSet(u"output"_s) && request.output.isEmpty())
        usage(u"-o needs a file name, or '-' for standard output."_s, m_name);
    if (request.output == u"-")
        request.output.clear();
    if (m_parser.isSet(u"format"_s)) {
        const auto found = Formats.find(value(u"format"_s));
        if (found == Formats.end())
            usage(u"--format is text, lines, csv, tsv, jsonl, sql, xlsx2 or xlsx1, not '%1'."_s.arg(
                      value(u"format"_s)),
                  m_name);
        request.format = found->second;
    } else if (!request.output.isEmpty()) {
        request.format = formatOfFile(request.output);
    }

    if (const auto* rows = std::get_if<RowFormat>(&request.format)) {
        request.run.shardUnit = rowsKeptTogether(*rows);
        if (m_parser.isSet(u"table"_s)) {
            if (*rows != RowFormat::Sql)
                usage(u"--table names the table of the sql format."_s, m_name);
            request.table = value(u"table"_s);
            if (request.table.isEmpty())
                usage(u"--table needs a name."_s, m_name);
        }
    } else {
        if (request.output.isEmpty())
            usage(u"A workbook is written to a file: give -o FILE."_s, m_name);
        if (request.run.shards > 1)
            usage(u"A workbook is one file: it cannot be made in shards."_s, m_name);
        if (m_parser.isSet(u"table"_s))
            usage(u"--table names the table of the sql format."_s, m_name);
        const QString refusal = workbookRefusal(request.run.count);
        if (!refusal.isEmpty())
            usage(refusal, m_name);
    }
    return request;
}

int Command::generate()
{
    if (!parse({{{u"n"_s, u"count"_s}, {}, u"COUNT"_s},
                listOption(),
                genderOption(),
                {u"seed"_s, {}, u"N"_s},
                {u"unique"_s, {}},
                {u"shard"_s, {}, u"I/N"_s},
                {u"threads"_s, {}, u"N"_s},
                {u"format"_s, {}, u"FORMAT"_s},
                {u"table"_s, {}, u"NAME"_s},
                {{u"o"_s, u"output"_s}, {}, u"FILE"_s}},
               0, 0))
        return Companion::Done;
    const GenerateRequest request = readGenerate();

    NameLists lists(m_database);
    fillPanes(lists, request.list);
    const QString refusal = emptyPaneRefusal(lists.firstPane().count(), lists.lastPane().count());
    if (!refusal.isEmpty())
        throw Failure(refusal);
    RandomSource random;
    if (request.seed)
        random.seed(*request.seed);
    else
        random.seedFromTimeOfDay(SystemClock().secondsSinceMidnight());
    const NameRun run(lists.firstPane().names(), lists.lastPane().names(), random, request.run);

    // The names database is never written over; here a slip of the
    // command line, so a usage error.
    try {
        if (const auto* layout = std::get_if<OutputChoice>(&request.format)) {
            writeWorkbook(run, *layout, request.output, m_database);
            return Companion::Done;
        }
        const RowFormat format = std::get<RowFormat>(request.format);
        if (request.output.isEmpty()) {
            writeRows(run, format, request.table, request.threads,
                      [this](QByteArrayView bytes) { write(bytes, false); });
            write({}, true);
            return Companion::Done;
        }
        const std::unique_ptr<SafeFile> file = openResultsFile(request.output, m_database);
        writeRows(run, format, request.table, request.threads,
                  [&file](QByteArrayView bytes) { file->write(bytes); });
        file->commit();
    } catch (const NamesDatabaseRefusal&) {
        usage(u"-o %1 would replace the names database."_s.arg(request.output), m_name);
    }
    return Companion::Done;
}

int Command::names()
{
    if (!parse({listOption(), genderOption()}, 1, 1))
        return Companion::Done;
    const ListKind which = kind();
    const ListChoice list = choice(true);
    NameLists lists(m_database);
    fillPanes(lists, list);
    const PaneModel& pane = which == ListKind::FirstNames ? lists.firstPane() : lists.lastPane();
    QByteArray bytes;
    for (const QString& name : pane.names()) {
        bytes += name.toUtf8();
        bytes += '\n';
    }
    write(bytes);
    return Companion::Done;
}

int Command::add()
{
    if (!parse({listOption()}, 2, -1))
        return Companion::Done;
    const ListKind which = kind();
    const ListChoice list = choice(false);
    const QStringList typed = m_parser.positionalArguments().mid(1);
    std::optional<Connection> connection;
    addNames([&]() -> Connection& { return connection.emplace(m_database); }, which, list, typed,
             BlankNames::Refuse);
    return Companion::Done;
}

int Command::remove()
{
    if (!parse({listOption(), genderOption()}, 2, -1))
        return Companion::Done;
    const ListKind which = kind();
    const ListChoice list = choice(true);
    if (list.user)
        usage(u"Your own list is emptied as a whole: use 'quillane-cli clear'."_s, m_name);
    const QStringList names = m_parser.positionalArguments().mid(1);
    std::optional<Connection> connection;
    deleteNames([&]() -> Connection& { return connection.emplace(m_database); }, which, list, names,
                AbsentNames::Refuse);
    return Companion::Done;
}

int Command::clear()
{
    if (!parse({}, 1, 1))
        return Companion::Done;
    const ListKind which = kind();
    Connection connection(m_database);
    clearList(connection, which);
    return Companion::Done;
}

int Command::import()
{
    if (!parse({listOption()}, 2, -1))
        return Companion::Done;
    const ListKind which = kind();
    const ListChoice list = choice(false);
    const QStringList paths = m_parser.positionalArguments().mid(1);

    // The files stand or fall together: one transaction holds them all, and
    // the first file that cannot be read, or any refused name, ends it.
    inOneTransaction([&](Connection& connection) {
        QStringList reports;
        for (const QString& path : paths) {
            importNameFile([&]() -> Connection& { return connection; }, path, which, list,
                           [&](const ImportProblem& problem) {
                               switch (problem.culprit) {
                               case ImportCulprit::Name:
                                   reports.append(u"%1: %2"_s.arg(path, problem.description));
                                   return;
                               case ImportCulprit::File:
                                   // The other reports name the file themselves.
                                   if (problem.step == ImportStep::FindFile)
                                       throw Failure(u"%1: %2"_s.arg(problem.description, path));
                                   throw Failure(problem.description);
                               case ImportCulprit::Database:
                                   throw Failure(problem.description);
                               }
                           });
        }
        if (!reports.isEmpty())
            throw Failure(reports.join(u"\n"_s) + u" Nothing was imported."_s);
    });
    return Companion::Done;
}

} // namespace

namespace Companion {

int run(const QStringList& arguments, const QString& programFolder, std::FILE* out, std::FILE* err)
{
    // Every line of a complaint names the program, as a script's log
    // shows it among other programs' lines. A complaint may quote a file or
    // an argument, whose control characters a terminal would obey.
    const auto complain = [err](const QString& message) {
        for (const QString& line : message.split(u'\n'))
            std::fputs(qUtf8Printable(Program + u": "_s + escapeControlCharacters(line) + u'\n'),
                       err);
    };
    try {
        // The options before the command, in any order, then the command and
        // its own.
        std::optional<QString> database;
        bool help = false;
        bool version = false;
        qsizetype at = 1;
        for (; at < arguments.size() && arguments.at(at).startsWith(u'-'); ++at) {
            const QString& option = arguments.at(at);
            if (option == u"-h" || option == u"--help") {
                if (std::exchange(help, true))
                    givenTwice(u"--help"_s);
            } else if (option == u"--version") {
                if (std::exchange(version, true))
                    givenTwice(option);
            } else if (option == u"--database" || option.startsWith(u"--database=")) {
                if (database)
                    givenTwice(u"--database"_s);
                if (option == u"--database" && ++at == arguments.size())
                    usage(u"Missing value after '--database'."_s);
                database = option == u"--database" ? arguments.at(at) : option.section(u'=', 1);
                // Never the default database in place of one a script
                // failed to name.
                if (database->isEmpty())
                    usage(u"--database needs a file name."_s);
            } else {
                usage(u"Unknown option '%1'."_s.arg(option));
            }
        }
        const QStringList command = arguments.mid(at);
        if (version) {
            if (!command.isEmpty())
                usage(u"Unexpected argument '%1'."_s.arg(command.first()));
            const QString where = database
                                      ? u"names database: "_s + *database
                                      : describeNamesDatabase(chooseNamesDatabase(programFolder));
            std::fputs(qUtf8Printable(Program + u' ' + QStringLiteral(QUILLANE_VERSION) + u'\n'
                                      + where + u'\n'),
                       out);
            return Done;
        }
        if (help && command.isEmpty()) {
            std::fputs(GeneralHelp, out);
            return Done;
        }
        if (command.isEmpty())
            usage(u"Give a command."_s);
        // --help before a command asks for that command's help.
        return Command(command.first(),
                       command.mid(1) + (help ? QStringList{u"--help"_s} : QStringList{}),
                       database.value_or(QString()), programFolder, out)
            .run();
    } catch (const UsageProblem& problem) {
        // One line, the way to the help included.
        complain(u"%1 Try '%2 %3--help'."_s.arg(
            problem.message, Program,
            problem.command.isEmpty() ? QString() : problem.command + u' '));
        return UsageError;
    } catch (...) {
        complain(describeCurrentException());
        return Failed;
    }
}

} // namespace Companion
