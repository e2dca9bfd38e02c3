#pragma once

#include "base/pointer.h"

#include <QList>

// A window pointer that remembers every value it was set to.
class FakePointer : public PointerOwner {
public:
    int mousePointer() const override { return value; }
    void setMousePointer(int pointer) override
    {
        value = pointer;
        history.append(pointer);
    }

    int value = MousePointer::Default;
    QList<int> history;
};
