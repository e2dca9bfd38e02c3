#include "names/listeditor.h"

#include "app/dialogs.h"
#include "app/failure.h"
#include "app/pointer.h"
#include "app/programfiles.h"
#include "app/trap.h"
#include "names/database.h"
#include "names/namelists.h"
#include "names/namesplitter.h"

#include <QFile>
#include <QFileInfo>

#include <optional>

using namespace Qt::StringLiterals;

namespace {

const QString OpenTitle = u"Load List(s) - Hold Ctrl to select multiple list files"_s;
const QString OpenFilter = u"Text Files (*.txt);;All Files (*)"_s;

// Large enough to keep the reading cheap, small enough that a file of one
// enormous line costs no more memory than this.
constexpr qint64 ReadChunkBytes = 256 * 1024;

// A file at least this large has its names inserted before the table's
// indexes are built again, instead of each name updating them (about
// 400,000 names and more); a smaller file costs less done name by name.
constexpr qint64 BulkFileBytes = 4 * 1024 * 1024;

// How much of an overlong name its report quotes.
constexpr qsizetype QuotedLength = 40;

// The insert for the list the source option chooses; none with neither
// option selected. First names added to the built-in list join its female
// table, whatever the gender.
const char* insertStatement(ListKind kind, const ListChoice& choice)
{
    const bool first = kind == ListKind::FirstNames;
    if (choice.builtIn)
        return first ? Sql::InsertBuiltInFirstName : Sql::InsertBuiltInLastName;
    if (choice.user)
        return first ? Sql::InsertUserFirstName : Sql::InsertUserLastName;
    return nullptr;
}

// The table an insert statement of the catalogue writes to.
const char* insertTable(const char* insert)
{
    if (insert == Sql::InsertBuiltInFirstName)
        return "system_ffirstname";
    if (insert == Sql::InsertUserFirstName)
        return "user_firstname";
    if (insert == Sql::InsertBuiltInLastName)
        return "system_lastname";
    return "user_lastname";
}

Connection& opened(std::optional<Connection>& connection)
{
    if (!connection)
        throw Failure(u"The names database is not open."_s);
    return *connection;
}

[[noreturn]] void refuseOverlong(const QString& text)
{
    throw Failure(u"The name \"%1...\" is longer than %2 characters and was not stored."_s.arg(
        text.left(QuotedLength), QString::number(NameSplitter::MaxNameLength)));
}

} // namespace

ListEditor::ListEditor(Dialogs& dialogs, QString databasePath, NameLists& lists,
                       PointerOwner& window, std::function<ListChoice()> choice)
    : m_dialogs(dialogs)
    , m_databasePath(std::move(databasePath))
    , m_lists(lists)
    , m_window(window)
    , m_choice(std::move(choice))
{
}

void ListEditor::PushButton2_Click()
{
    addName(ListKind::FirstNames, u"in Tessmark.Form1.PushButton2_Click "_s,
            u"Input first name: "_s);
}

void ListEditor::PushButton5_Click()
{
    addName(ListKind::LastNames, u"in Tessmark.Form1.PushButton5_Click "_s, u"Input last name: "_s);
}

void ListEditor::PushButton4_Click(int selectedRow)
{
    deleteNames(ListKind::FirstNames, selectedRow, u"in Tessmark.Form1.PushButton4_Click "_s,
                ClosingLine::Short);
}

void ListEditor::PushButton3_Click(int selectedRow)
{
    deleteNames(ListKind::LastNames, selectedRow, u"in Tessmark.Form1.PushButton3_Click "_s,
                ClosingLine::Long);
}

void ListEditor::PushButton6_Click()
{
    importFiles(ListKind::FirstNames, u"in Tessmark.Form1.PushButton6_Click "_s);
}

void ListEditor::PushButton7_Click()
{
    importFiles(ListKind::LastNames, u"in Tessmark.Form1.PushButton7_Click "_s);
}

void ListEditor::addName(ListKind kind, const QString& location, const QString& prompt)
{
    Trap trap(m_dialogs, location, ClosingLine::Long);
    const ListChoice choice = m_choice();
    // Opening holds no lock on the file, so the connection may wait open
    // while the user types.
    std::optional<Connection> connection;
    trap(10, [&] { connection.emplace(m_databasePath); });
    QString reply;
    trap(20, [&] { reply = m_dialogs.inputBox(prompt, ApplicationTitle); });
    trap(30, [&] {
        const QString name = QString(reply).remove(u'\'');
        if (name.trimmed().isEmpty())
            return;
        const char* insert = insertStatement(kind, choice);
        if (!insert)
            return;
        if (name.size() > NameSplitter::MaxNameLength)
            refuseOverlong(name);
        opened(connection).execute(insert, name);
    });
    trap(40, [&] { connection.reset(); });
    trap(50, [&] { m_lists.RefreshLists(choice); });
}

void ListEditor::deleteNames(ListKind kind, int selectedRow, const QString& location,
                             ClosingLine closing)
{
    Trap trap(m_dialogs, location, closing);
    const PaneModel& pane = kind == ListKind::FirstNames ? m_lists.firstPane() : m_lists.lastPane();
    if (pane.count() == 0)
        return;
    const ListChoice choice = m_choice();
    std::optional<Connection> connection;
    trap(10, [&] { connection.emplace(m_databasePath); });

    const auto selectedName = [&] {
        if (selectedRow < 0 || selectedRow >= pane.count())
            throw Failure(u"No name is selected in the list."_s);
        return pane.names().at(selectedRow);
    };
    const auto deleteSelected = [&](const char* sql) {
        const QString name = selectedName();
        opened(connection).execute(sql, name);
    };
    if (choice.builtIn) {
        if (kind == ListKind::FirstNames) {
            if (choice.both || choice.male)
                trap(20, [&] { deleteSelected(Sql::DeleteBuiltInMaleFirstName); });
            if (choice.both || choice.female)
                trap(30, [&] { deleteSelected(Sql::DeleteBuiltInFemaleFirstName); });
        } else {
            trap(40, [&] { deleteSelected(Sql::DeleteBuiltInLastName); });
        }
    } else if (choice.user) {
        // "Clear": the whole list goes, whatever is selected.
        trap(50, [&] {
            opened(connection)
                .execute(kind == ListKind::FirstNames ? Sql::ClearUserFirstNames
                                                      : Sql::ClearUserLastNames);
        });
    }
    trap(60, [&] { connection.reset(); });
    trap(70, [&] { m_lists.RefreshLists(choice); });
}

void ListEditor::importFiles(ListKind kind, const QString& location)
{
    Trap trap(m_dialogs, location, ClosingLine::Long);
    QStringList paths;
    trap(10, [&] { paths = m_dialogs.openFileNames(OpenTitle, OpenFilter); });
    if (paths.isEmpty())
        return;
    {
        BusyPointer busy(m_window);
        // Each file reports its own failures and never throws.
        trap(20, [&] {
            for (const QString& path : std::as_const(paths))
                FileToListview(path, kind);
        });
    }
    trap(30, [&] { m_lists.RefreshLists(m_choice()); });
}

void ListEditor::FileToListview(const QString& path, ListKind kind)
{
    Trap trap(m_dialogs, u"in Tessmark.Main.FileToListview "_s, ClosingLine::Long);
    if (!FileExists(path)) {
        refuse(m_dialogs, u"File not found"_s);
        return;
    }
    const char* sql = insertStatement(kind, m_choice());

    // Without the database, the file or a transaction there is nothing this
    // file can give, so its import ends with the one report.
    std::optional<Connection> connection;
    if (!trap(10, [&] { connection.emplace(m_databasePath); }))
        return;
    QFile file(path);
    if (!trap(20, [&] {
            // A device or a pipe could be read without end.
            if (!QFileInfo(path).isFile())
                throw Failure(u"This is not a file that names can be read from: %1"_s.arg(path));
            if (!file.open(QIODevice::ReadOnly))
                throw Failure(file.errorString());
        }))
        return;
    if (!sql)
        return;
    // One commit for the whole file: a statement that fails changes nothing
    // and the names before it stay, and a million names take seconds.
    std::optional<Connection::Transaction> transaction;
    std::optional<Connection::Prepared> insert;
    QList<QByteArray> indexes;
    if (!trap(30, [&] {
            // Room for the pages a large import touches.
            connection->execute("pragma cache_size = -65536");
            transaction.emplace(*connection);
            if (file.size() >= BulkFileBytes)
                indexes = connection->dropPlainIndexes(insertTable(sql));
            insert.emplace(*connection, sql);
        })) {
        // Never commit a half-made start: the indexes must not go missing.
        if (transaction) {
            try {
                transaction->rollback();
            } catch (...) {
                // The connection closes next, which undoes it all the same.
            }
        }
        return;
    }

    NameSplitter splitter;
    std::vector<NameSplitter::Name> names;
    QByteArray buffer(ReadChunkBytes, Qt::Uninitialized);
    int rejected = 0;
    bool reading = true;
    while (reading) {
        names.clear();
        reading = false;
        trap(40, [&] {
            const qint64 got = file.read(buffer.data(), buffer.size());
            if (got < 0)
                throw Failure(file.errorString());
            if (got == 0) {
                splitter.finish(names);
                return;
            }
            splitter.feed(QByteArrayView(buffer.constData(), got), names);
            reading = true;
        });
        for (const NameSplitter::Name& name : names) {
            const auto store = [&] {
                if (name.overlong())
                    refuseOverlong(name.text);
                insert->run(name.text);
            };
            if (rejected < MaxReportsPerFile) {
                if (!trap(50, store))
                    ++rejected;
                continue;
            }
            // Past the bound the names are still tried, and the rest counted.
            try {
                store();
            } catch (...) {
                ++rejected;
            }
        }
    }
    trap(60, [&] {
        if (rejected > MaxReportsPerFile)
            throw Failure(
                u"%1 more names of this file were not stored."_s.arg(rejected - MaxReportsPerFile));
    });
    // Should an index fail to build, the names are kept all the same: the
    // panes are then slower to fill, never wrong.
    trap(70, [&] {
        insert.reset();
        for (const QByteArray& index : std::as_const(indexes))
            connection->execute(index.constData());
    });
    trap(80, [&] { transaction->commit(); });
}
