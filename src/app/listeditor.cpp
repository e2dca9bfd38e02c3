#include "app/listeditor.h"

#include "base/dialogs.h"
#include "base/failure.h"
#include "base/pointer.h"
#include "base/programfiles.h"
#include "base/trap.h"
#include "names/database.h"
#include "names/listoperations.h"
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

// The step of FileToListview that reports a problem of the import.
int importLine(ImportStep step)
{
    switch (step) {
    case ImportStep::FindFile:
    case ImportStep::OpenDatabase:
        return 10;
    case ImportStep::OpenFile:
        return 20;
    case ImportStep::Begin:
        return 30;
    case ImportStep::Read:
        return 40;
    case ImportStep::Store:
        return 50;
    case ImportStep::MoreRefused:
        return 60;
    case ImportStep::RebuildIndexes:
        return 70;
    case ImportStep::Commit:
        return 80;
    }
    return 0;
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
        addNames([&]() -> Connection& { return opened(connection); }, kind, choice, {reply},
                 BlankNames::Skip);
    });
    trap(40, [&] { connection.reset(); });
    trap(50, [&] { refreshLists(choice); });
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
    if (choice.builtIn) {
        // Null when nothing is selected: each delete that would have run fails.
        const QString name = selectedRow >= 0 && selectedRow < pane.count()
                                 ? pane.names().at(selectedRow)
                                 : QString();
        ::deleteNames([&]() -> Connection& { return opened(connection); }, kind, choice, {name},
                      AbsentNames::Ignore,
                      [&](const char* sql, const std::function<void()>& work) {
                          return trap(deleteLine(sql), work);
                      });
    } else if (choice.user) {
        // "Clear": the whole list goes, whatever is selected.
        trap(50, [&] { clearList(opened(connection), kind); });
    }
    trap(60, [&] { connection.reset(); });
    trap(70, [&] { refreshLists(choice); });
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
    trap(30, [&] { refreshLists(m_choice()); });
}

void ListEditor::FileToListview(const QString& path, ListKind kind)
{
    Trap trap(m_dialogs, u"in Tessmark.Main.FileToListview "_s, ClosingLine::Long);
    // A connection of its own for each file.
    std::optional<Connection> connection;
    importNameFile([&]() -> Connection& { return connection.emplace(m_databasePath); }, path, kind,
                   m_choice(),
                   [&](const ImportProblem& problem) {
                       if (problem.step == ImportStep::FindFile) {
                           refuse(m_dialogs, problem.description);
                           return;
                       }
                       trap(importLine(problem.step), [&] { throw Failure(problem.description); });
                   });
}

void ListEditor::refreshLists(const ListChoice& choice)
{
    BusyPointer busy(m_window);
    m_lists.RefreshLists(choice);
}
