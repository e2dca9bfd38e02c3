#include "names/namesplitter.h"

namespace {

// The characters of Windows-1252 from 0x80 to 0x9F; the rest are Latin-1.
// The five bytes it leaves undefined read as the control characters of the
// same value, as Windows reads them.
constexpr char16_t Windows1252High[32] = {
    0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0x008D, 0x017D, 0x008F, 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};

QString fromWindows1252(QByteArrayView bytes)
{
    QString text(bytes.size(), Qt::Uninitialized);
    QChar* out = text.data();
    for (const char byte : bytes) {
        const auto b = static_cast<unsigned char>(byte);
        *out++ = b >= 0x80 && b < 0xA0 ? QChar(Windows1252High[b - 0x80]) : QChar(char16_t(b));
    }
    return text;
}

// How many bytes at the end of a UTF-8 text start a character that the
// next bytes complete: a lead byte followed by fewer continuation bytes than
// it announces. Bytes that can start no character are not held back.
qsizetype incompleteTail(QByteArrayView bytes)
{
    const qsizetype size = bytes.size();
    for (qsizetype back = 1; back <= 3 && back <= size; ++back) {
        const auto byte = static_cast<unsigned char>(bytes[size - back]);
        if ((byte & 0xC0) == 0x80)
            continue; // a continuation byte: look further back
        const int needed = byte >= 0xC2 && byte <= 0xDF   ? 2
                           : byte >= 0xE0 && byte <= 0xEF ? 3
                           : byte >= 0xF0 && byte <= 0xF4 ? 4
                                                          : 0;
        return needed > back ? back : 0;
    }
    return 0;
}

} // namespace

void NameSplitter::chooseEncoding()
{
    QStringConverter::Encoding encoding = QStringConverter::Utf8;
    if (const auto marked = QStringConverter::encodingForData(m_head)) {
        encoding = *marked;
    } else {
        // Valid UTF-8 but for a character cut off at the end of the probe.
        const QByteArrayView probe =
            QByteArrayView(m_head).first(std::min(m_head.size(), TextProbe));
        QStringDecoder check(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
        const QString text = check.decode(probe.first(probe.size() - incompleteTail(probe)));
        m_windows1252 = check.hasError();
    }
    m_utf8 = encoding == QStringConverter::Utf8 && !m_windows1252;
    // UTF-8 is decoded in whole characters (see decode()), each run of bytes
    // on its own. The byte-order mark is dropped by scan(), so that only the
    // one at the very start goes.
    m_decoder.emplace(encoding, m_utf8 ? QStringConverter::Flag::Stateless
                                             | QStringConverter::Flag::ConvertInitialBom
                                       : QStringConverter::Flag::ConvertInitialBom);
}

void NameSplitter::start(std::vector<Name>& names)
{
    chooseEncoding();
    const QByteArray head = std::exchange(m_head, {});
    const qsizetype probe = std::min(head.size(), TextProbe);
    m_probing = true;
    decode(QByteArrayView(head).first(probe), names);
    m_probing = false;
    decode(QByteArrayView(head).sliced(probe), names);
}

void NameSplitter::decode(QByteArrayView bytes, std::vector<Name>& names)
{
    if (m_windows1252) {
        scan(fromWindows1252(bytes), names);
        return;
    }
    if (!m_utf8) {
        const QString text = m_decoder->decode(bytes);
        scan(text, names);
        return;
    }
    // The decoder is not told where a character was cut between two reads:
    // carried over by the decoder itself, an invalid sequence there could
    // swallow the character after it. So a cut character waits for the rest.
    QByteArray joined;
    if (!m_partial.isEmpty()) {
        joined = m_partial;
        joined.append(bytes);
        bytes = joined;
    }
    const qsizetype held = incompleteTail(bytes);
    const QString text = m_decoder->decode(bytes.first(bytes.size() - held));
    m_partial = bytes.last(held).toByteArray();
    scan(text, names);
}

void NameSplitter::feed(QByteArrayView bytes, std::vector<Name>& names)
{
    if (!m_decoder) {
        m_head.append(bytes);
        if (m_head.size() < TextProbe)
            return;
        start(names);
        return;
    }
    if (!bytes.isEmpty())
        decode(bytes, names);
}

void NameSplitter::finish(std::vector<Name>& names)
{
    if (!m_decoder) {
        start(names);
    }
    if (!m_partial.isEmpty()) {
        // A character cut off by the end of the file.
        const QString text = m_decoder->decode(std::exchange(m_partial, {}));
        scan(text, names);
    }
    endName(names);
}

std::vector<NameSplitter::Name> NameSplitter::split(QByteArrayView bytes)
{
    NameSplitter splitter;
    std::vector<Name> names;
    splitter.feed(bytes, names);
    splitter.finish(names);
    return names;
}

void NameSplitter::scan(QStringView text, std::vector<Name>& names)
{
    if (m_atStart && !text.isEmpty()) {
        m_atStart = false;
        if (text.front() == QChar(0xFEFF))
            text = text.sliced(1);
    }
    for (const QChar c : text) {
        switch (c.unicode()) {
        case u'\r':
        case u'\n':
            endName(names);
            break;
        case u'\'':
            break;
        case u'\0':
            m_text = m_text && !m_probing;
            break;
        default:
            if (m_probing && c != u'\t' && c.category() == QChar::Other_Control)
                m_text = false;
            if (m_length < MaxNameLength)
                m_current.append(c);
            ++m_length;
        }
    }
}

void NameSplitter::endName(std::vector<Name>& names)
{
    if (m_length == 0)
        return;
    names.push_back({std::move(m_current), m_length});
    m_current = QString();
    m_length = 0;
}
