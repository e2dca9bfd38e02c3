#include "base/clock.h"

#include <QEventLoop>
#include <QTime>
#include <QTimer>

#include <algorithm>
#include <chrono>
#include <cmath>

double SystemClock::secondsSinceMidnight() const
{
    return QTime::currentTime().msecsSinceStartOfDay() / 1000.0;
}

double SystemClock::steadySeconds() const
{
    using namespace std::chrono;
    return duration<double>(steady_clock::now().time_since_epoch()).count();
}

void SystemClock::waitForEvents(int milliseconds)
{
    // A nested event loop sleeps in the event dispatcher until something
    // arrives, so a wait costs no processor time; the timer ends it.
    QEventLoop loop;
    QTimer timer;
    timer.setSingleShot(true);
    timer.setTimerType(Qt::PreciseTimer);
    QObject::connect(&timer, &QTimer::timeout, &loop, &QEventLoop::quit);
    timer.start(milliseconds > 0 ? milliseconds : 0);
    loop.exec();
}

void waitSeconds(Clock& clock, double seconds)
{
    const double start = clock.steadySeconds();
    for (;;) {
        const double left = seconds - (clock.steadySeconds() - start);
        if (left <= 0)
            return;
        // Rounded up, so a last wait of a fraction of a millisecond is not
        // asked for as zero and repeated at full speed; a long wait goes by
        // in steps of a minute at most.
        clock.waitForEvents(int(std::min(std::ceil(left * 1000.0), 60000.0)));
    }
}
