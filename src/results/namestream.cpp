#include "results/namestream.h"

#include "base/failure.h"
#include "results/resultrows.h"
#include "results/spreadsheet.h"

#include <QStringEncoder>

#include <algorithm>
#include <cstring>
#include <optional>
#include <vector>

using namespace Qt::StringLiterals;

std::int64_t rowsKeptTogether(RowFormat format)
{
    return format == RowFormat::Sql ? SqlBatchRows : 1;
}

QString separatedField(const QString& name, QChar separator)
{
    const bool plain = std::none_of(name.cbegin(), name.cend(), [separator](QChar c) {
        return c == separator || c == u'"' || c == u'\r' || c == u'\n';
    });
    return plain ? name : u'"' + QString(name).replace(u"\""_s, u"\"\""_s) + u'"';
}

QString sqlIdentifier(const QString& name)
{
    // The words that cannot stand as a table's name in the common dialects.
    static const QSet<QString> keywords = {
        u"add"_s,     u"all"_s,    u"alter"_s,    u"and"_s,    u"as"_s,      u"between"_s,
        u"by"_s,      u"case"_s,   u"check"_s,    u"column"_s, u"create"_s,  u"cross"_s,
        u"default"_s, u"delete"_s, u"distinct"_s, u"drop"_s,   u"else"_s,    u"exists"_s,
        u"from"_s,    u"full"_s,   u"grant"_s,    u"group"_s,  u"having"_s,  u"in"_s,
        u"index"_s,   u"inner"_s,  u"insert"_s,   u"into"_s,   u"is"_s,      u"join"_s,
        u"key"_s,     u"left"_s,   u"like"_s,     u"limit"_s,  u"not"_s,     u"null"_s,
        u"on"_s,      u"or"_s,     u"order"_s,    u"outer"_s,  u"primary"_s, u"references"_s,
        u"right"_s,   u"select"_s, u"set"_s,      u"table"_s,  u"then"_s,    u"to"_s,
        u"union"_s,   u"unique"_s, u"update"_s,   u"user"_s,   u"using"_s,   u"values"_s,
        u"when"_s,    u"where"_s,  u"with"_s,
    };
    const bool plain =
        !name.isEmpty() && !name.front().isDigit()
        && std::all_of(
            name.cbegin(), name.cend(),
            [](QChar c) { return c.unicode() < 128 && (c.isLetterOrNumber() || c == u'_'); })
        && !keywords.contains(name.toLower());
    return plain ? name : u'"' + QString(name).replace(u"\""_s, u"\"\""_s) + u'"';
}

namespace {

QString asItIs(const QString& name)
{
    return name;
}

QString csvField(const QString& name)
{
    return separatedField(name, u',');
}

QString tsvField(const QString& name)
{
    return separatedField(name, u'\t');
}

// A JSON string: quotes and backslashes escaped, and every control
// character, which JSON does not allow in a string as it stands.
QString jsonString(const QString& name)
{
    QString text = u"\""_s;
    for (const QChar c : name) {
        switch (c.unicode()) {
        case u'"':
            text += u"\\\""_s;
            break;
        case u'\\':
            text += u"\\\\"_s;
            break;
        case u'\n':
            text += u"\\n"_s;
            break;
        case u'\r':
            text += u"\\r"_s;
            break;
        case u'\t':
            text += u"\\t"_s;
            break;
        default:
            if (c.unicode() < 0x20)
                text += u"\\u%1"_s.arg(int(c.unicode()), 4, 16, QChar(u'0'));
            else
                text += c;
        }
    }
    return text + u'"';
}

// An SQL string literal: in single quotes, its quotes doubled. A backslash
// is an ordinary character in SQL's strings.
QString sqlString(const QString& name)
{
    return u'\'' + QString(name).replace(u"'"_s, u"''"_s) + u'\'';
}

// How a format lays out a row: what comes before the first name, between
// the names and after the last, and a field's text from a name.
struct Layout {
    QByteArray header;
    QByteArray before;
    QByteArray between;
    QByteArray after;
    QString (*field)(const QString& name);
    bool utf8; // else the system's 8-bit encoding, as the results window's file
};

Layout layoutOf(RowFormat format)
{
    switch (format) {
    case RowFormat::Text:
        return {{}, {}, " ", "\r\n", asItIs, false};
    case RowFormat::Lines:
        return {{}, {}, " ", "\n", asItIs, false};
    case RowFormat::Csv:
        return {"first_name,last_name\r\n", {}, ",", "\r\n", csvField, false};
    case RowFormat::Tsv:
        return {"first_name\tlast_name\n", {}, "\t", "\n", tsvField, true};
    case RowFormat::JsonLines:
        return {{}, "{\"first_name\":", ",\"last_name\":", "}\n", jsonString, true};
    case RowFormat::Sql:
        return {{}, "(", ", ", ")", sqlString, true};
    }
    return {};
}

char* copyBytes(char* out, QByteArrayView bytes)
{
    // An empty piece (no header, nothing before a name) may have no data
    // pointer at all, which memcpy must not be handed.
    if (!bytes.isEmpty())
        std::memcpy(out, bytes.data(), std::size_t(bytes.size()));
    return out + bytes.size();
}

// A table of names encoded once, one after another in one buffer, each
// with the text that goes before and after it in a row.
class EncodedNames {
public:
    EncodedNames(const QStringList& names, const Layout& layout, QByteArrayView before,
                 QByteArrayView after)
    {
        QStringEncoder encoder(layout.utf8 ? QStringEncoder::Utf8 : QStringEncoder::System,
                               QStringEncoder::Flag::Stateless);
        m_starts.reserve(std::size_t(names.size()) + 1);
        m_starts.push_back(0);
        qsizetype used = 0;
        for (const QString& name : names) {
            // Encoded straight into place, the buffer doubling when it is
            // full: growing it by each name's size would copy the whole
            // table once per name.
            const QString field = layout.field(name);
            const qsizetype most =
                before.size() + encoder.requiredSpace(field.size()) + after.size();
            if (used + most > m_bytes.size())
                m_bytes.resize(std::max(m_bytes.size() * 2, used + most));
            char* const start = m_bytes.data() + used;
            const char* const end =
                copyBytes(encoder.appendToBuffer(copyBytes(start, before), field), after);
            m_longest = std::max(m_longest, qsizetype(end - start));
            used = end - m_bytes.constData();
            m_starts.push_back(std::uint32_t(used));
        }
        // A short entry is copied as a whole block of Short bytes.
        m_bytes.truncate(used);
        m_bytes.append(Short, '\0');
    }
    qsizetype longest() const { return m_longest; }

    // Copies entry index to out; returns the end of the copy. Up to Short
    // bytes past that end may be overwritten.
    char* put(std::uint32_t index, char* out) const
    {
        const char* from = m_bytes.constData() + m_starts[index];
        const auto size = std::size_t(m_starts[index + 1] - m_starts[index]);
        // One fixed-size copy is a couple of moves; most names are short.
        if (size <= Short)
            std::memcpy(out, from, Short);
        else
            std::memcpy(out, from, size);
        return out + size;
    }

    static constexpr std::size_t Short = 32;

private:
    QByteArray m_bytes;
    // Four bytes an entry: the table is read at random, and the smaller it
    // is, the more of it stays in the cache.
    std::vector<std::uint32_t> m_starts;
    qsizetype m_longest = 0;
};

// What SQL puts around its rows: an INSERT before every SqlBatchRows-th
// row, and after each row the comma or the semicolon that ends the
// statement. Other formats put nothing.
class Statements {
public:
    Statements(RowFormat format, const QString& table, std::int64_t count)
        : m_sql(format == RowFormat::Sql)
        , m_insert(m_sql ? "INSERT INTO " + sqlIdentifier(table).toUtf8()
                               + " (first_name, last_name) VALUES\n"
                         : QByteArray())
        , m_count(count)
    {
    }
    bool any() const { return m_sql; }
    // The most bytes around a row.
    qsizetype most() const { return m_sql ? m_insert.size() + 2 : 0; }
    char* open(std::int64_t row, char* to) const
    {
        return m_sql && row % SqlBatchRows == 0 ? copyBytes(to, m_insert) : to;
    }
    char* close(std::int64_t row, char* to) const
    {
        if (!m_sql)
            return to;
        return copyBytes(to, row % SqlBatchRows == SqlBatchRows - 1 || row == m_count - 1 ? ";\n"
                                                                                          : ",\n");
    }

private:
    bool m_sql;
    QByteArray m_insert;
    std::int64_t m_count;
};

// The rows of a format over two tables of names: the one place a format's
// rows are laid out, for the streamed run and the results window alike.
class FormattedRows : public RowFormatter {
public:
    // count is the number of rows in all: SQL ends its last statement there.
    FormattedRows(const QStringList& firstNames, const QStringList& lastNames, std::int64_t count,
                  RowFormat format, const QString& table)
        : m_layout(layoutOf(format))
        , m_firsts(firstNames, m_layout, m_layout.before, m_layout.between)
        , m_lasts(lastNames, m_layout, {}, m_layout.after)
        , m_statements(format, table, count)
    {
    }

    const Layout& layout() const { return m_layout; }

    void appendRows(std::int64_t firstRow, std::span<const NamePair> pairs,
                    QByteArray& out) const override
    {
        // Room for the longest row each time, written straight into place.
        const qsizetype most = m_firsts.longest() + m_lasts.longest() + m_statements.most();
        const qsizetype start = out.size();
        out.resize(start + most * qsizetype(pairs.size()) + qsizetype(EncodedNames::Short));
        char* to = out.data() + start;
        // Without statements, the loop the most rows run stays the plainest.
        if (!m_statements.any()) {
            for (const NamePair& pair : pairs)
                to = m_lasts.put(pair.last, m_firsts.put(pair.first, to));
        } else {
            std::int64_t row = firstRow;
            for (const NamePair& pair : pairs) {
                to = m_statements.open(row, to);
                to = m_lasts.put(pair.last, m_firsts.put(pair.first, to));
                to = m_statements.close(row, to);
                ++row;
            }
        }
        out.truncate(to - out.constData());
    }

private:
    Layout m_layout;
    EncodedNames m_firsts;
    EncodedNames m_lasts;
    Statements m_statements;
};

// The rows of a run as saving reads them, made a block at a time as they
// are read in order.
class RunRows : public ResultRows {
public:
    explicit RunRows(const NameRun& run)
        : m_run(run)
    {
    }
    int rowCount() const override { return int(m_run.count()); }
    QString firstName(int row) const override { return m_run.firstNames().at(pairAt(row).first); }
    QString lastName(int row) const override { return m_run.lastNames().at(pairAt(row).last); }

private:
    static constexpr int Block = 1 << 14;
    const NamePair& pairAt(int row) const
    {
        if (row < m_start || row >= m_start + int(m_pairs.size())) {
            m_start = row - row % Block;
            m_pairs.resize(std::size_t(std::min<std::int64_t>(Block, m_run.count() - m_start)));
            m_run.pairs(m_start, m_pairs);
        }
        return m_pairs[std::size_t(row - m_start)];
    }

    const NameRun& m_run;
    mutable int m_start = 0;
    mutable std::vector<NamePair> m_pairs;
};

} // namespace

void writeRows(const NameRun& run, RowFormat format, const QString& table, int threads,
               const ByteSink& sink)
{
    const FormattedRows formatter(run.firstNames(), run.lastNames(), run.count(), format, table);
    if (run.isFirstShard() && !formatter.layout().header.isEmpty())
        sink(formatter.layout().header);
    streamRows(run, formatter, threads, sink);
}

QByteArray formatRows(const ResultRows& rows, RowFormat format, const QString& table)
{
    const Layout layout = layoutOf(format);
    QByteArray out = layout.header;
    if (const std::optional<IndexedNames> indexed = rows.indexedNames()) {
        // A block at a time: a block has room for its longest row written
        // once per row, so a long name costs little.
        constexpr std::size_t Block = 1 << 14;
        const std::span<const NamePair> pairs(indexed->rows);
        const FormattedRows formatter(indexed->firstNames, indexed->lastNames,
                                      std::int64_t(pairs.size()), format, table);
        for (std::size_t start = 0; start < pairs.size(); start += Block)
            formatter.appendRows(std::int64_t(start),
                                 pairs.subspan(start, std::min(Block, pairs.size() - start)), out);
        return out;
    }

    // Other rows name by name, in the same layout, straight into the end of
    // the buffer, which grows by doubling.
    QStringEncoder encoder(layout.utf8 ? QStringEncoder::Utf8 : QStringEncoder::System,
                           QStringEncoder::Flag::Stateless);
    const int count = rows.rowCount();
    const Statements statements(format, table, count);
    const qsizetype fixed =
        layout.before.size() + layout.between.size() + layout.after.size() + statements.most();
    out.reserve(out.size() + qsizetype(count) * 18);
    qsizetype used = out.size();
    for (int row = 0; row < count; ++row) {
        const QString first = layout.field(rows.firstName(row));
        const QString last = layout.field(rows.lastName(row));
        const qsizetype most = used + fixed + encoder.requiredSpace(first.size() + last.size());
        if (most > out.size())
            out.resize(std::max(out.size() * 2, most));
        char* to = statements.open(row, out.data() + used);
        to = encoder.appendToBuffer(copyBytes(to, layout.before), first);
        to = encoder.appendToBuffer(copyBytes(to, layout.between), last);
        to = statements.close(row, copyBytes(to, layout.after));
        used = to - out.constData();
    }
    out.truncate(used);
    return out;
}

QString workbookRefusal(std::int64_t count)
{
    if (count <= SheetRows)
        return {};
    return u"A worksheet holds at most %1 rows: ask for fewer names, or for csv."_s.arg(SheetRows);
}

void writeWorkbook(const NameRun& run, OutputChoice layout, const QString& path,
                   const QString& namesDatabase)
{
    const QString refusal = workbookRefusal(run.count());
    if (!refusal.isEmpty())
        throw Failure(refusal);
    saveWorkbook(RunRows(run), layout, path, namesDatabase);
}
