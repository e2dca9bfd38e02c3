#include "app/listeditor.h"

#include "base/dialogs.h"
#include "base/failure.h"
#include "base/pointer.h"
#include "base/programfiles.h"
#include "base/trap.h"
#include "names/database.h"
#include "names/namelists.h"

#include <optional>

using namespace Qt::StringLiterals;

namespace {

const QString OpenTitle = u"Load List(s) - Hold Ctrl to select multiple list files"_s;
const QString OpenFilter = u"Text Files (*.txt);;All Files (*)"_s;

Connection& opened(std::optional<Connection>& connection)
{
    if (!connection)
        throw Failure(u"The names database is not open."_s);
    return *connection;
}

// The step of the delete button's handler that runs a built-in delete.
int deleteLine(const char* sql)
{
    if (sql == Sql::DeleteBuiltInMaleFirstName)
        return 20;
    if (sql == Sql::DeleteBuiltInFemaleFirstName)
        return 30;
    return 40;
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
        const QString name = nameToStore(reply, choice);
        if (!name.isEmpty())
            opened(connection).execute(insertStatement(kind, choice), name);
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
        for (const char* sql : builtInDeletes(kind, choice))
            trap(deleteLine(sql), [&] { deleteSelected(sql); });
    } else if (choice.user) {
        // "Clear": the whole list goes, whatever is selected.
        trap(50, [&] { opened(connection).execute(clearStatement(kind)); });
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
    std::optional<NameFileImport> import;
    if (!trap(20, [&] {
            import.emplace(*connection, path, sql);
            import->openFile();
        }))
        return;
    if (!sql)
        return;
    // One commit for the whole file: a statement that fails changes nothing
    // and the names before it stay, and a million names take seconds.
    if (!trap(30, [&] { import->begin(); }))
        return;

    std::vector<NameSplitter::Name> names;
    int rejected = 0;
    bool reading = true;
    while (reading) {
        names.clear();
        reading = false;
        trap(40, [&] { reading = import->readNames(names); });
        for (const NameSplitter::Name& name : names) {
            const auto store = [&] { import->store(name); };
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
            throw Failure(moreRejected(rejected - MaxReportsPerFile));
    });
    // Should an index fail to build, the names are kept all the same: the
    // panes are then slower to fill, never wrong.
    trap(70, [&] { import->rebuildIndexes(); });
    trap(80, [&] { import->commit(); });
}
