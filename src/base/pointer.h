#pragma once

// The mouse pointer of a window: one shape over the whole window, its
// controls included.
namespace MousePointer {
inline constexpr int Default = 0;
inline constexpr int Hourglass = 11;
inline constexpr int Custom = 99; // the window's custom cursor, or the arrow without one
} // namespace MousePointer

// A window whose mouse pointer long operations and the hover rule set.
class PointerOwner {
public:
    virtual ~PointerOwner() = default;
    virtual int mousePointer() const = 0;
    virtual void setMousePointer(int pointer) = 0;
};

// The hover rule: a mouse move over a control sets the window's pointer to
// the control's value, unless a long operation shows the hourglass.
void applyHoverRule(PointerOwner& window, int pointer);

// Shows the hourglass for the lifetime of the guard and puts the default
// pointer back on every path out, failures included.
class BusyPointer {
public:
    explicit BusyPointer(PointerOwner& window);
    ~BusyPointer();
    BusyPointer(const BusyPointer&) = delete;
    BusyPointer& operator=(const BusyPointer&) = delete;

private:
    PointerOwner& m_window;
};
