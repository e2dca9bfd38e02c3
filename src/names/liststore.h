#pragma once

// The pieces of the list operations (names/listoperations.h): the statement
// each chooses for the source and gender, the rules a name must pass, and the
// reading and storing of one text file.

#include "names/database.h"
#include "names/listchoice.h"
#include "names/namesplitter.h"

#include <QFile>
#include <QList>
#include <QString>

#include <optional>
#include <vector>

// Which pane's list an operation works on.
enum class ListKind { FirstNames = 1, LastNames = 2 };

// The insert for the list the source option chooses; none with neither
// option selected. First names added to the built-in list join its female
// table, whatever the gender.
const char* insertStatement(ListKind kind, const ListChoice& choice);

// The deletes that take one name out of the built-in list: first names
// leave the male table, the female table or both, as the gender says.
QList<const char*> builtInDeletes(ListKind kind, const ListChoice& choice);

// The statement that empties a user list ("Clear").
const char* clearStatement(ListKind kind);

// The name that a typed text stores: the text without its apostrophes.
// Empty when nothing is to be stored: a text of nothing but spaces, or a
// choice with no source selected. A name that is too long or holds a control
// character is refused (Failure).
QString nameToStore(const QString& typed, const ListChoice& choice);

// A file with more rejected names than this reports the first ones and
// then, once, how many more were rejected (moreRejected).
inline constexpr int MaxImportReportsPerFile = 10;
QString moreRejected(int count);

// One text file's names into one list, in one transaction: a statement that
// fails changes nothing, and the names before it stay unless the caller
// rolls back. On a connection with a transaction already open, the import
// joins it and leaves its end to the caller: several files then stand or
// fall together. Every step throws Failure.
class NameFileImport {
public:
    NameFileImport(Connection& connection, const QString& path, const char* insert);
    ~NameFileImport();
    NameFileImport(const NameFileImport&) = delete;
    NameFileImport& operator=(const NameFileImport&) = delete;

    // Opens the file for reading; devices and pipes are refused.
    void openFile();
    // Starts the transaction (or joins the open one) and prepares the insert. A start that fails
    // part way is undone: the table keeps its indexes.
    void begin();
    // Appends the names of the file's next piece; false once the end is
    // reached (the file's last name may come with that call).
    bool readNames(std::vector<NameSplitter::Name>& names);
    // False once the start of the file has shown that it is not text.
    bool isText() const;
    // Inserts one name; one that no list stores is refused, as a typed one.
    void store(const NameSplitter::Name& name);
    // The file's name as the user writes it.
    QString fileName() const;
    // Builds the indexes that a large file's import dropped.
    void rebuildIndexes();
    // Both end the import's own transaction; a joined one stays open.
    void commit();
    // Undoes everything since begin().
    void rollback();

private:
    Connection& m_connection;
    QFile m_file;
    const char* m_insert;
    QByteArray m_buffer;
    NameSplitter m_splitter;
    bool m_finished = false;
    std::optional<Connection::Transaction> m_transaction;
    std::optional<Connection::Prepared> m_prepared;
    QList<QByteArray> m_indexes;
};
