#include "names/liststore.h"

#include "base/failure.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>

using namespace Qt::StringLiterals;

namespace {

// Large enough to keep the reading cheap, small enough that a file of one
// enormous line costs no more memory than this.
constexpr qint64 ReadChunkBytes = 256 * 1024;

// A file at least this large has its names inserted before the table's
// indexes are built again, instead of each name updating them (about
// 400,000 names and more); a smaller file costs less done name by name.
constexpr qint64 BulkFileBytes = 4 * 1024 * 1024;

// How much of an overlong name its report quotes.
constexpr qsizetype QuotedLength = 40;

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

bool isControl(QChar c)
{
    const QChar::Category category = c.category();
    return category == QChar::Other_Control || category == QChar::Separator_Line
           || category == QChar::Separator_Paragraph;
}

// The text with its control characters written out, so that a message never
// carries a line break or a terminal's escape sequence.
QString visible(const QString& text)
{
    QString shown;
    for (const QChar c : text) {
        if (c == u'\t')
            shown += u"\\t"_s;
        else if (c == u'\n')
            shown += u"\\n"_s;
        else if (c == u'\r')
            shown += u"\\r"_s;
        else if (isControl(c))
            shown += u"\\u%1"_s.arg(uint(c.unicode()), 4, 16, QChar(u'0'));
        else
            shown += c;
    }
    return shown;
}

// Throws the report for a name that no list stores: one longer than a list
// holds, or one with a control character (a line break, a tab, an escape),
// which would break every line, file and terminal the name reaches later.
void requireStorable(const QString& text, qsizetype length)
{
    if (length > NameSplitter::MaxNameLength)
        throw Failure(u"The name \"%1...\" is longer than %2 characters and was not stored."_s.arg(
            visible(text.left(QuotedLength)), QString::number(NameSplitter::MaxNameLength)));
    if (std::any_of(text.begin(), text.end(), isControl))
        throw Failure(
            u"The name \"%1\" holds a control character and was not stored."_s.arg(visible(text)));
}

// Only spaces make a reply blank: a tab or a no-break space is a character
// that the user typed.
bool isBlank(const QString& text)
{
    return std::all_of(text.begin(), text.end(), [](QChar c) { return c == u' '; });
}

} // namespace

const char* insertStatement(ListKind kind, const ListChoice& choice)
{
    const bool first = kind == ListKind::FirstNames;
    if (choice.builtIn)
        return first ? Sql::InsertBuiltInFirstName : Sql::InsertBuiltInLastName;
    if (choice.user)
        return first ? Sql::InsertUserFirstName : Sql::InsertUserLastName;
    return nullptr;
}

QList<const char*> builtInDeletes(ListKind kind, const ListChoice& choice)
{
    if (kind == ListKind::LastNames)
        return {Sql::DeleteBuiltInLastName};
    QList<const char*> deletes;
    if (choice.both || choice.male)
        deletes.append(Sql::DeleteBuiltInMaleFirstName);
    if (choice.both || choice.female)
        deletes.append(Sql::DeleteBuiltInFemaleFirstName);
    return deletes;
}

const char* clearStatement(ListKind kind)
{
    return kind == ListKind::FirstNames ? Sql::ClearUserFirstNames : Sql::ClearUserLastNames;
}

QString moreRejected(int count)
{
    return count == 1 ? u"1 more name of this file was not stored."_s
                      : u"%1 more names of this file were not stored."_s.arg(count);
}

QString nameToStore(const QString& typed, const ListChoice& choice)
{
    const QString name = QString(typed).remove(u'\'');
    if (isBlank(name) || (!choice.builtIn && !choice.user))
        return {};
    requireStorable(name, name.size());
    return name;
}

NameFileImport::NameFileImport(Connection& connection, const QString& path, const char* insert)
    : m_connection(connection)
    , m_file(path)
    , m_insert(insert)
{
}

NameFileImport::~NameFileImport() = default;

void NameFileImport::openFile()
{
    // A device or a pipe could be read without end.
    if (!QFileInfo(m_file.fileName()).isFile())
        throw Failure(u"%1 is not a file that names can be read from."_s.arg(fileName()));
    if (!m_file.open(QIODevice::ReadOnly))
        throw Failure(u"The file %1 cannot be read: %2"_s.arg(fileName(), m_file.errorString()));
}

void NameFileImport::begin()
{
    try {
        // Room for the pages a large import touches.
        m_connection.execute("pragma cache_size = -65536");
        if (!m_connection.inTransaction())
            m_transaction.emplace(m_connection);
        if (m_file.size() >= BulkFileBytes)
            m_indexes = m_connection.dropPlainIndexes(insertTable(m_insert));
        m_prepared.emplace(m_connection, m_insert);
    } catch (...) {
        // Never commit a half-made start: the indexes must not go missing.
        if (m_transaction) {
            try {
                rollback();
            } catch (...) {
                // The connection closes next, which undoes it all the same.
            }
        }
        throw;
    }
}

bool NameFileImport::readNames(std::vector<NameSplitter::Name>& names)
{
    if (m_finished)
        return false;
    if (m_buffer.isEmpty())
        m_buffer.resize(ReadChunkBytes);
    const qint64 got = m_file.read(m_buffer.data(), m_buffer.size());
    if (got < 0)
        throw Failure(u"The file %1 could not be read to its end: %2"_s.arg(fileName(),
                                                                            m_file.errorString()));
    if (got == 0) {
        m_splitter.finish(names);
        m_finished = true;
        return false;
    }
    m_splitter.feed(QByteArrayView(m_buffer.constData(), got), names);
    return true;
}

QString NameFileImport::fileName() const
{
    return QDir::toNativeSeparators(m_file.fileName());
}

bool NameFileImport::isText() const
{
    return m_splitter.isText();
}

void NameFileImport::store(const NameSplitter::Name& name)
{
    requireStorable(name.text, name.length);
    if (!m_prepared)
        throw Failure(u"The import has not begun."_s);
    m_prepared->run(name.text);
}

void NameFileImport::rebuildIndexes()
{
    m_prepared.reset();
    for (const QByteArray& index : std::as_const(m_indexes))
        m_connection.execute(index.constData());
    m_indexes.clear();
}

void NameFileImport::commit()
{
    m_prepared.reset();
    if (!m_transaction)
        return;
    m_transaction->commit();
    m_transaction.reset();
}

void NameFileImport::rollback()
{
    m_prepared.reset();
    if (!m_transaction)
        return;
    // Its end is final, whether the engine agrees or not: the transaction
    // is forgotten before the rollback can throw.
    struct Forget {
        std::optional<Connection::Transaction>& transaction;
        ~Forget() { transaction.reset(); }
    } forget{m_transaction};
    m_transaction->rollback();
}
