#include "generate/generation.h"

#include <algorithm>
#include <cfenv>
#include <limits>

QString StripSpaces(const QString& text)
{
    // Names are short: a plain scan beats the library's vectorised search,
    // whose set-up dominates at this length.
    if (std::none_of(text.cbegin(), text.cend(), [](QChar c) { return c == u' '; }))
        return text; // shares the pane's text
    QString stripped = text;
    stripped.remove(u' ');
    return stripped;
}

QString ProperCase(const QString& text)
{
    // Per code point, so letters outside the basic plane change case too;
    // each character keeps its length (the simple case mapping).
    QString result;
    result.reserve(text.size());
    bool startsWord = true;
    const auto append = [&result](char32_t c) {
        if (QChar::requiresSurrogates(c)) {
            result.append(QChar(QChar::highSurrogate(c)));
            result.append(QChar(QChar::lowSurrogate(c)));
        } else {
            result.append(QChar(char16_t(c)));
        }
    };
    for (qsizetype i = 0; i < text.size(); ++i) {
        char32_t c = text.at(i).unicode();
        if (QChar::isHighSurrogate(c) && i + 1 < text.size() && text.at(i + 1).isLowSurrogate()) {
            c = QChar::surrogateToUcs4(text.at(i), text.at(i + 1));
            ++i;
        }
        const char32_t lower = QChar::toLower(c);
        append(startsWord ? QChar::toUpper(lower) : lower);
        startsWord = c == U' ' || c == U'\t' || c == U'\r';
    }
    return result;
}

QString tidyName(const QString& text)
{
    const QString tidied = ProperCase(StripSpaces(text));
    // Most stored names are already tidy: keep one copy of their text.
    return tidied == text ? text : tidied;
}

CountText::CountText(const QString& text, const QLocale& locale)
{
    bool ok = false;
    const double value = locale.toDouble(QStringView(text).trimmed(), &ok);
    m_isNumber = ok && std::isfinite(value);
    m_value = m_isNumber ? value : 0.0;
    // Beyond 2^53 a double no longer holds every whole number.
    const qlonglong whole = locale.toLongLong(QStringView(text).trimmed(), &ok);
    if (ok)
        m_whole = whole;
}

std::int32_t CountText::count() const
{
    constexpr double lowest = std::numeric_limits<std::int32_t>::min();
    if (!m_isNumber || m_value < lowest || tooMany())
        return 0;
    // nearbyint rounds in the current mode, which is to nearest, ties even.
    const int previous = std::fegetround();
    std::fesetround(FE_TONEAREST);
    const double rounded = std::nearbyint(m_value);
    std::fesetround(previous);
    return static_cast<std::int32_t>(rounded);
}

std::optional<std::int64_t> CountText::wholeCount() const
{
    if (m_whole)
        return m_whole;
    constexpr double beyond = 0x1.0p63; // the first double past the 64-bit range
    if (!m_isNumber || m_value >= beyond || m_value < -beyond)
        return std::nullopt;
    const int previous = std::fegetround();
    std::fesetround(FE_TONEAREST);
    const double rounded = std::nearbyint(m_value);
    std::fesetround(previous);
    return static_cast<std::int64_t>(rounded);
}

QString refusalBeforeStart(const CountText& count, qsizetype firstNames, qsizetype lastNames)
{
    if (count.tooMany())
        return GenerationMessages::TooMany;
    return emptyPaneRefusal(firstNames, lastNames);
}

QString emptyPaneRefusal(qsizetype firstNames, qsizetype lastNames)
{
    if (firstNames == 0)
        return GenerationMessages::NoFirstName;
    if (lastNames == 0)
        return GenerationMessages::NoLastName;
    return {};
}

namespace {

// The run's table of tidied names for one pane: a pane item is tidied the
// first time it is drawn and then found by its position.
class TidiedNames {
public:
    TidiedNames(const QStringList& pane, QStringList& table, std::int32_t draws)
        : m_pane(pane)
        , m_table(table)
        , m_slots(std::size_t(pane.size()), Unset)
    {
        // No more distinct names than items or draws: sized once, the table
        // never grows by copying.
        m_table.reserve(std::min<qsizetype>(pane.size(), draws));
    }

    std::uint32_t at(int paneIndex)
    {
        std::uint32_t& slot = m_slots[std::size_t(paneIndex)];
        if (slot == Unset) {
            slot = std::uint32_t(m_table.size());
            m_table.append(tidyName(m_pane.at(paneIndex)));
        }
        return slot;
    }

private:
    static constexpr std::uint32_t Unset = std::numeric_limits<std::uint32_t>::max();
    const QStringList& m_pane;
    QStringList& m_table;
    std::vector<std::uint32_t> m_slots;
};

} // namespace

NameGenerator::NameGenerator(const QStringList& firstPane, const QStringList& lastPane,
                             RandomSource& random)
    : m_firstPane(firstPane)
    , m_lastPane(lastPane)
    , m_random(random)
{
}

GeneratedNames NameGenerator::generate(std::int32_t count, const Progress& progress)
{
    GeneratedNames names;
    if (count < 1)
        return names;

    const int firstCount = int(m_firstPane.size());
    const int lastCount = int(m_lastPane.size());
    TidiedNames firsts(m_firstPane, names.firstNames, count);
    TidiedNames lasts(m_lastPane, names.lastNames, count);
    names.rows.reserve(std::size_t(count));

    // The bar shows i * 100 / count rounded half to even. Kept as a quotient
    // and a remainder that grow with i, so no division runs per name.
    const std::int64_t n = count;
    std::int64_t quotient = 0;
    std::int64_t remainder = 0;
    int shown = -1;

    for (std::int64_t i = 1; i <= n; ++i) {
        const NamePair positions = drawPositions(m_random, firstCount, lastCount);
        const std::uint32_t last = lasts.at(int(positions.last));
        const std::uint32_t first = firsts.at(int(positions.first));
        names.rows.push_back({first, last});

        remainder += 100;
        while (remainder >= n) {
            remainder -= n;
            ++quotient;
        }
        if (progress) {
            const std::int64_t twice = 2 * remainder;
            const int value = int(quotient + (twice > n || (twice == n && (quotient & 1)) ? 1 : 0));
            if (value != shown) {
                shown = value;
                progress(value);
            }
        }
    }
    return names;
}
