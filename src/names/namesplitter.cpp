#include "names/namesplitter.h"

namespace {

// Enough bytes to tell every byte-order mark apart (UTF-32 needs four).
constexpr qsizetype EncodingProbe = 4;

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
    QStringConverter::Encoding encoding = QStringConverter::System;
    if (const auto marked = QStringConverter::encodingForData(m_head))
        encoding = *marked;
    m_utf8 = encoding == QStringConverter::System || encoding == QStringConverter::Utf8;
    // UTF-8 is decoded in whole characters (see decode()), each run of bytes
    // on its own. The byte-order mark is dropped by scan(), so that only the
    // one at the very start goes.
    m_decoder.emplace(encoding, m_utf8 ? QStringConverter::Flag::Stateless
                                             | QStringConverter::Flag::ConvertInitialBom
                                       : QStringConverter::Flag::ConvertInitialBom);
}

void NameSplitter::decode(QByteArrayView bytes, std::vector<Name>& names)
{
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
        if (m_head.size() < EncodingProbe)
            return;
        chooseEncoding();
        const QByteArray head = std::exchange(m_head, {});
        decode(head, names);
        return;
    }
    if (!bytes.isEmpty())
        decode(bytes, names);
}

void NameSplitter::finish(std::vector<Name>& names)
{
    if (!m_decoder) {
        chooseEncoding();
        const QByteArray head = std::exchange(m_head, {});
        decode(head, names);
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
        case u'\0':
            break;
        default:
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
