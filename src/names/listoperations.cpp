#include "names/listoperations.h"

#include "base/failure.h"
#include "base/programfiles.h"

#include <QDir>

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
            bool databaseFailed = false;
            const bool done = run(sql, [&] {
                if (name.isNull())
                    throw Failure(u"No name is selected in the list."_s);
                try {
                    connection->execute(sql, name);
                } catch (const DatabaseFailure& failure) {
                    databaseFailed = !failure.refusedRow();
                    throw;
                }
                deleted += connection->changes();
            });
            // After a failure of the database itself the rest is not tried:
            // the engine may have undone the transaction, and what followed
            // would run outside of it. The transaction is rolled back.
            if (!done && (databaseFailed || !connection->inTransaction()))
                return;
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
    std::optional<NameFileImport> import;
    // Ends the file's import: nothing of it stays (or, joined to the caller's
    // transaction, the caller decides), and the one report says why.
    const auto end = [&](ImportStep step, ImportCulprit culprit, const QString& text) {
        if (import) {
            try {
                import->rollback();
            } catch (...) {
                // The connection closes next, which undoes it all the same.
            }
        }
        report(step, culprit, text);
    };
    // Runs one step of the import; a failure is reported and ends the step.
    // A failure of the database itself also ends the import at once: the
    // engine may already have undone the transaction, and going on would
    // store the rest of the file name by name, outside of any.
    const auto attempt = [&](ImportStep step, const auto& work) {
        try {
            work();
            return true;
        } catch (const DatabaseFailure& failure) {
            end(step, ImportCulprit::Database, failure.description());
        } catch (...) {
            const ImportCulprit culprit = culpritAt(step);
            if (culprit == ImportCulprit::File)
                report(step, culprit, describeCurrentException());
            else
                end(step, culprit, describeCurrentException());
        }
        return false;
    };

    if (!FileExists(path)) {
        report(ImportStep::FindFile, ImportCulprit::File, u"File not found"_s);
        return;
    }
    const char* insert = insertStatement(kind, choice);
    Connection* connection = nullptr;
    if (!attempt(ImportStep::OpenDatabase, [&] { connection = &connect(); }))
        return;
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
        if (!attempt(ImportStep::Read, [&] { reading = import->readNames(names); })
            && !connection->inTransaction())
            return;
        if (!import->isText()) {
            end(ImportStep::Read, ImportCulprit::File,
                u"The file %1 is not text: it holds control characters. Nothing of it was "
                "stored."_s.arg(import->fileName()));
            return;
        }
        for (const NameSplitter::Name& name : names) {
            QString reason;
            try {
                import->store(name);
                continue;
            } catch (const DatabaseFailure& failure) {
                // Only a name that a rule of the table refused leaves the
                // database as it was, the transaction still open.
                if (!failure.refusedRow()) {
                    end(ImportStep::Store, ImportCulprit::Database, failure.description());
                    return;
                }
                if (!connection->inTransaction()) {
                    end(ImportStep::Store, ImportCulprit::Database,
                        u"%1: %2"_s.arg(QDir::toNativeSeparators(connection->path()),
                                        failure.description()));
                    return;
                }
                reason = failure.description();
            } catch (...) {
                reason = describeCurrentException();
            }
            // Past the bound the names are still tried, and the rest counted.
            if (++refused <= MaxImportReportsPerFile)
                report(ImportStep::Store, ImportCulprit::Name, reason);
        }
    }
    if (refused > MaxImportReportsPerFile)
        report(ImportStep::MoreRefused, ImportCulprit::Name,
               moreRejected(refused - MaxImportReportsPerFile));
    if (!attempt(ImportStep::RebuildIndexes, [&] { import->rebuildIndexes(); }))
        return;
    attempt(ImportStep::Commit, [&] { import->commit(); });
}
