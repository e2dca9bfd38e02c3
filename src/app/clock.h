#pragma once

// The time of day, for seeding the random source and timing pauses.
class Clock {
public:
    virtual ~Clock() = default;
    // Seconds since local midnight, fractions included.
    virtual double secondsSinceMidnight() const = 0;
};

class SystemClock : public Clock {
public:
    double secondsSinceMidnight() const override;
};
