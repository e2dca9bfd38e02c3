#include "base/pointer.h"

void applyHoverRule(PointerOwner& window, int pointer)
{
    if (window.mousePointer() != MousePointer::Hourglass)
        window.setMousePointer(pointer);
}

BusyPointer::BusyPointer(PointerOwner& window)
    : m_window(window)
{
    m_window.setMousePointer(MousePointer::Hourglass);
}

BusyPointer::~BusyPointer()
{
    m_window.setMousePointer(MousePointer::Default);
}
