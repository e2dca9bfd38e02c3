#pragma once

// Turning the two panes and the requested count into random full names.
//
// The window reads the count box and the panes and hands them here; the
// generator draws, tidies and collects the rows without touching a widget,
// and reports its progress through a callback so the window can move its bar.

#include "generate/randomsource.h"

#include <QLocale>
#include <QString>
#include <QStringList>

#include <cmath>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

// The text without any U+0020; tabs and other blanks stay.
QString StripSpaces(const QString& text);

// Lower case throughout, then upper case for the first character and for any
// character after a space, a tab or a carriage return. Nothing else starts a
// capital: not a hyphen, an apostrophe or a prefix.
QString ProperCase(const QString& text);

// A pane item as it appears in the results: spaces removed, capitals regular.
QString tidyName(const QString& text);

// The count box's text read in the user's number format.
class CountText {
public:
    // Blanks around the number are allowed; infinities and NaN are not numbers.
    CountText(const QString& text, const QLocale& locale);

    bool isNumber() const { return m_isNumber; }
    double value() const { return m_value; }

    // The bound test: a number of 1,000,001 or more is refused. Counts just
    // below the bound round up to it and pass.
    bool tooMany() const { return m_isNumber && m_value >= 1000001.0; }

    // How many names to make: the nearest 32-bit integer, a half going to the
    // even neighbour. Numbers below the 32-bit range make no names (0), as do
    // texts that are not numbers.
    std::int32_t count() const;

    // The same reading without the window's bound, for runs that stream
    // their rows: the nearest 64-bit integer, a half to the even neighbour,
    // exact for whole numbers of any length. None for a text that is not a
    // number or a number outside the 64-bit range.
    std::optional<std::int64_t> wholeCount() const;

private:
    bool m_isNumber = false;
    double m_value = 0;
    std::optional<std::int64_t> m_whole; // when the text is a whole number
};

namespace GenerationMessages {
inline const QString TooMany = QStringLiteral("You must select an amount less than one million.");
inline const QString NoFirstName = QStringLiteral("You must add a first name");
inline const QString NoLastName = QStringLiteral("You must add a last name");
inline const QString NotANumber = QStringLiteral("How many does not appear to be a number.");
} // namespace GenerationMessages

// The refusal that ends a run before the busy pointer goes up, in the order
// the checks run: the bound, then an empty first-name pane, then an empty
// last-name pane. Empty when the run may go on. A text that is not a number
// passes here; the run refuses it afterwards (NotANumber).
QString refusalBeforeStart(const CountText& count, qsizetype firstNames, qsizetype lastNames);
// The same without the bound: for runs that take any count.
QString emptyPaneRefusal(qsizetype firstNames, qsizetype lastNames);

// One row of results: indices into the run's tables of tidied names.
struct NamePair {
    std::uint32_t first;
    std::uint32_t last;
};

// What one run makes: each distinct name drawn, tidied once, and the rows in
// the order made.
struct GeneratedNames {
    QStringList firstNames;
    QStringList lastNames;
    std::vector<NamePair> rows;
};

// One full name's two draws, the last name's first: a position in the
// last-name pane and one in the first-name pane, each from 0. Every way of
// generating draws through here, so a seed gives the same names in the
// window and on the command line.
inline NamePair drawPositions(RandomSource& random, int firstCount, int lastCount)
{
    // For a draw of 0 or more, truncation is the floor, without the library
    // call; r * n never rounds up to n for any n of 32 bits.
    const auto last = std::uint32_t(random.next() * lastCount);
    const auto first = std::uint32_t(random.next() * firstCount);
    return {first, last};
}

// Generation over two panes. For every full name the last name is drawn
// first and the first name second, two draws and no more, so the rows replay
// from the random source's seed.
class NameGenerator {
public:
    // The shown value of a bar from 0 to 100: called whenever it changes,
    // at most 101 times a run.
    using Progress = std::function<void(int percent)>;

    NameGenerator(const QStringList& firstPane, const QStringList& lastPane, RandomSource& random);

    // Makes count rows; none when count is below 1. The panes must not be
    // empty when count is 1 or more.
    GeneratedNames generate(std::int32_t count, const Progress& progress = {});

private:
    const QStringList& m_firstPane;
    const QStringList& m_lastPane;
    RandomSource& m_random;
};
