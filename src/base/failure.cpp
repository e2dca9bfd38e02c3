#include "base/failure.h"

#include <new>

using namespace Qt::StringLiterals;

Failure::Failure(QString description)
    : m_description(std::move(description))
    , m_utf8(m_description.toUtf8())
{
}

QString describeCurrentException()
{
    try {
        throw;
    } catch (const Failure& failure) {
        return failure.description();
    } catch (const std::bad_alloc&) {
        return u"Out of memory"_s;
    } catch (const std::exception& e) {
        return QString::fromLocal8Bit(e.what());
    } catch (...) {
        return u"Unknown error"_s;
    }
}

QString escapeControlCharacters(const QString& text)
{
    QString shown;
    shown.reserve(text.size());
    for (const QChar c : text) {
        // Line and paragraph separators break lines as a line feed does.
        const bool control = c.category() == QChar::Other_Control
                             || c.category() == QChar::Separator_Line
                             || c.category() == QChar::Separator_Paragraph;
        if (!control || c == u'\n') {
            shown.append(c);
            continue;
        }
        switch (c.unicode()) {
        case u'\t':
            shown.append(u"\\t"_s);
            break;
        case u'\r':
            shown.append(u"\\r"_s);
            break;
        default:
            shown.append(c.unicode() < 0x100 ? u"\\x%1"_s.arg(c.unicode(), 2, 16, QChar(u'0'))
                                             : u"\\u%1"_s.arg(c.unicode(), 4, 16, QChar(u'0')));
        }
    }
    return shown;
}
