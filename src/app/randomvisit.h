#pragma once

#include <QUrl>

class Clock;
class RandomSource;
class Shell;

// The product's web page.
inline const QUrl ProductWebPage = QUrl(QStringLiteral("https://quillane.org/"));

// Seeds the program's random source from the time of day (the only seeding
// in the program), draws once, and in about one start in a hundred (when the
// draw makes n = 7 of 1 to 100) opens the product's web page without waiting.
// The draw is used up whatever n is; generation goes on from the next one.
void RandomVisit(RandomSource& random, const Clock& clock, Shell& shell);
