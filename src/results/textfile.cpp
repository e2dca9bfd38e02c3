#include "results/textfile.h"

#include "base/safefile.h"
#include "results/namestream.h"
#include "results/resultrows.h"
#include "results/resultsfile.h"

#include <QStringEncoder>

#include <algorithm>
#include <memory>
#include <optional>
#include <vector>

using namespace Qt::StringLiterals;

namespace {

// How a format lays out its rows: a header line, the field between the two
// names, the line end, and a field's text from a name.
struct RowLayout {
    QByteArrayView header;
    char separator;
    QByteArrayView lineEnd;
    QString (*field)(const QString& name);
};

QString asItIs(const QString& name)
{
    return name;
}

QString csvField(const QString& name)
{
    return separatedField(name, u',');
}

// A table of names encoded once, one after another in one buffer.
class EncodedTable {
public:
    EncodedTable(const QStringList& names, const RowLayout& layout, QStringEncoder& encoder)
    {
        m_ends.reserve(std::size_t(names.size()));
        for (const QString& name : names) {
            m_bytes += encoder.encode(layout.field(name));
            m_ends.push_back(m_bytes.size());
        }
    }
    QByteArrayView at(std::uint32_t index) const
    {
        const qsizetype begin = index == 0 ? 0 : m_ends[index - 1];
        return QByteArrayView(m_bytes.constData() + begin, m_ends[index] - begin);
    }

private:
    QByteArray m_bytes;
    std::vector<qsizetype> m_ends;
};

// Appends bytes to a buffer that grows by doubling.
class Output {
public:
    explicit Output(qsizetype expected) { m_bytes.resize(expected); }

    // Room for at least most more bytes; returns where they go.
    char* reserve(qsizetype most)
    {
        if (m_used + most > m_bytes.size())
            m_bytes.resize(std::max(m_bytes.size() * 2, m_used + most));
        return m_bytes.data() + m_used;
    }
    void advanceTo(const char* end) { m_used = end - m_bytes.constData(); }
    void append(QByteArrayView bytes)
    {
        char* out = reserve(bytes.size());
        advanceTo(std::copy(bytes.begin(), bytes.end(), out));
    }
    QByteArray take()
    {
        m_bytes.truncate(m_used);
        return std::move(m_bytes);
    }

private:
    QByteArray m_bytes;
    qsizetype m_used = 0;
};

// Every row's bytes, in list order, in one buffer, in the system's
// encoding. Rows kept as indices into tables of names have each distinct
// name encoded once and copied from there; other rows are encoded name by
// name, straight into the end of the buffer.
QByteArray encodeRows(const ResultRows& rows, const RowLayout& layout)
{
    QStringEncoder encoder(QStringEncoder::System, QStringEncoder::Flag::Stateless);
    const int count = rows.rowCount();
    Output output(layout.header.size() + qsizetype(count) * 18);
    output.append(layout.header);

    if (const std::optional<IndexedNames> indexed = rows.indexedNames()) {
        const EncodedTable firsts(indexed->firstNames, layout, encoder);
        const EncodedTable lasts(indexed->lastNames, layout, encoder);
        for (const NamePair& row : indexed->rows) {
            const QByteArrayView first = firsts.at(row.first);
            const QByteArrayView last = lasts.at(row.last);
            char* out = output.reserve(first.size() + last.size() + 1 + layout.lineEnd.size());
            out = std::copy(first.begin(), first.end(), out);
            *out++ = layout.separator;
            out = std::copy(last.begin(), last.end(), out);
            out = std::copy(layout.lineEnd.begin(), layout.lineEnd.end(), out);
            output.advanceTo(out);
        }
        return output.take();
    }

    for (int row = 0; row < count; ++row) {
        const QString first = layout.field(rows.firstName(row));
        const QString last = layout.field(rows.lastName(row));
        char* out = output.reserve(encoder.requiredSpace(first.size() + last.size()) + 1
                                   + layout.lineEnd.size());
        out = encoder.appendToBuffer(out, first);
        *out++ = layout.separator;
        out = encoder.appendToBuffer(out, last);
        out = std::copy(layout.lineEnd.begin(), layout.lineEnd.end(), out);
        output.advanceTo(out);
    }
    return output.take();
}

} // namespace

QByteArray resultsText(const ResultRows& rows)
{
    return encodeRows(rows, {{}, ' ', "\r\n", asItIs});
}

QByteArray resultsLines(const ResultRows& rows)
{
    return encodeRows(rows, {{}, ' ', "\n", asItIs});
}

QByteArray resultsCsv(const ResultRows& rows)
{
    return encodeRows(rows, {"first_name,last_name\r\n", ',', "\r\n", csvField});
}

void WriteTextFile(const QByteArray& text, const QString& path, const QString& namesDatabase)
{
    const std::unique_ptr<SafeFile> file = openResultsFile(path, namesDatabase);
    file->write(text);
    file->commit();
}
