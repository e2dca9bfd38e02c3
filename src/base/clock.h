#pragma once

// The time of day, for seeding the random source, and the clock and event
// queue that timed waits use.
class Clock {
public:
    virtual ~Clock() = default;
    // Seconds since local midnight, fractions included.
    virtual double secondsSinceMidnight() const = 0;

    // Seconds, fractions included, on a clock that only runs forward from an
    // arbitrary origin. Waits are measured on it: the time of day jumps back
    // at midnight and whenever the system time is set.
    virtual double steadySeconds() const = 0;

    // Lets window events run as they arrive, sleeping between them, for
    // about the given milliseconds. The caller looks at the clock again
    // afterwards: the wait may end a little early.
    virtual void waitForEvents(int milliseconds) = 0;
};

class SystemClock : public Clock {
public:
    double secondsSinceMidnight() const override;
    double steadySeconds() const override;
    void waitForEvents(int milliseconds) override;
};

// Waits the given seconds (fractions allowed) while window events go on
// running, without keeping a processor busy. The time is measured on the
// steady clock, so the wait ends on time across midnight too.
void waitSeconds(Clock& clock, double seconds);
