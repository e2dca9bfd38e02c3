#include "names/listoperations.h"

#include "base/failure.h"
#include "base/programfiles.h"

#include <optional>

using namespace Qt::StringLiterals;

namespace {

// The transaction of one operation: its own, or the caller's when one is
// already open, whose end the caller then decides.
class Unit {
public:
    explicit Unit(Connection& connection)
    {
        if (!connection.inTransaction())
            m_own.emplace(connection);
    }
    void commit()
    {
        if (m_own)
            m_own->commit();
    }

private:
    std::optional<Connection::Transaction> m_own;
};

bool runAsItIs(const char*, const std::function<void()>& work)
{
    work();
    return true;
}

// The culprit of a failure at a step that is not a database failure.
ImportCulprit culpritAt(ImportStep step)
{
    switch (step) {
    case ImportStep::FindFile:
    case ImportStep::OpenFile:
    case ImportStep::Read:
        return ImportCulprit::File;
    case ImportStep::Store:
    case ImportStep::MoreRefused:
        return ImportCulprit::Name;
    default:
        return ImportCulprit::Database;
    }
}

} // namespace

void addNames(const ConnectionSource& connect, ListKind kind, const ListChoice& choice,
              const QStringList& typed, BlankNames blanks)
{
    const char* insert = insertStatement(kind, choice);
    QStringList names;
    for (const QString& text : typed) {
        const QString name = nameToStore(text, choice);
        if (!name.isEmpty())
            names.append(name);
        else if (blanks == BlankNames::Refuse && insert)
            throw Failure(u"The name \"%1\" is blank: nothing was added."_s.arg(text));
    }
    if (names.isEmpty())
        return;
    Connection& connection = connect();
    Unit unit(connection);
    for (const QString& name : std::as_const(names))
        connection.execute(insert, name);
    unit.commit();
}

void deleteNames(const ConnectionSource& connect, ListKind kind, const ListChoice& choice,
                 const QStringList& names, AbsentNames absent, const StatementStep& step)
{
    const QList<const char*> deletes = builtInDeletes(kind, choice);
    if (deletes.isEmpty() || names.isEmpty())
        return;
    const StatementStep run = step ? step : StatementStep(runAsItIs);
    Connection* connection = nullptr;
    std::optional<Unit> unit;
    if (!run(deletes.first(), [&] {
            connection = &connect();
            unit.emplace(*connection);
        }))
        return;
    for (const QString& name : names) {
        int deleted = 0;
        for (const char* sql : deletes) {
            run(sql, [&] {
                if (name.isNull())
                    throw Failure(u"No name is selected in the list."_s);
                connection->execute(sql, name);
                deleted += connection->changes();
            });
        }
        if (deleted == 0 && absent == AbsentNames::Refuse)
            throw Failure(u"\"%1\" is not in the list: nothing was deleted."_s.arg(name));
    }
    run(deletes.last(), [&] { unit->commit(); });
}

void clearList(Connection& connection, ListKind kind)
{
    Unit unit(connection);
    connection.execute(clearStatement(kind));
    unit.commit();
}

void importNameFile(const ConnectionSource& connect, const QString& path, ListKind kind,
                    const ListChoice& choice, const ImportProblems& problems)
{
    const auto report = [&](ImportStep step, ImportCulprit culprit, const QString& text) {
        problems(ImportProblem{step, culprit, text});
    };
    // Runs one step of the import; a failure is reported and ends the step.
    const auto attempt = [&](ImportStep step, const auto& work) {
        try {
            work();
            return true;
        } catch (...) {
            report(step, culpritAt(step), describeCurrentException());
            return false;
        }
    };

    if (!FileExists(path)) {
        report(ImportStep::FindFile, ImportCulprit::File, u"File not found"_s);
        return;
    }
    const char* insert = insertStatement(kind, choice);
    Connection* connection = nullptr;
    if (!attempt(ImportStep::OpenDatabase, [&] { connection = &connect(); }))
        return;
    std::optional<NameFileImport> import;
    if (!attempt(ImportStep::OpenFile, [&] {
            import.emplace(*connection, path, insert);
            import->openFile();
        }))
        return;
    if (!insert)
        return;
    // One commit for the whole file: a statement that fails changes nothing
    // and the names before it stay, and a million names take seconds.
    if (!attempt(ImportStep::Begin, [&] { import->begin(); }))
        return;

    std::vector<NameSplitter::Name> names;
    int refused = 0;
    bool reading = true;
    while (reading) {
        names.clear();
        reading = false;
        attempt(ImportStep::Read, [&] { reading = import->readNames(names); });
        for (const NameSplitter::Name& name : names) {
            try {
                import->store(name);
            } catch (...) {
                // Past the bound the names are still tried, and the rest counted.
                if (++refused <= MaxImportReportsPerFile)
                    report(ImportStep::Store, ImportCulprit::Name, describeCurrentException());
            }
        }
    }
    if (refused > MaxImportReportsPerFile)
        report(ImportStep::MoreRefused, ImportCulprit::Name,
               moreRejected(refused - MaxImportReportsPerFile));
    // Should an index fail to build, the names are kept all the same: the
    // panes are then slower to fill, never wrong.
    attempt(ImportStep::RebuildIndexes, [&] { import->rebuildIndexes(); });
    attempt(ImportStep::Commit, [&] { import->commit(); });
}
