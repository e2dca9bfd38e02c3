#pragma once

#include "base/pointer.h"

#include <QCursor>
#include <QObject>

#include <optional>

class QWidget;

// A window's mouse pointer shown as Qt cursors, and the hover rule wired to
// the window's controls. Controls that are not watched have no say: over them
// the pointer keeps whatever shape it had last.
class WindowPointer : public QObject, public PointerOwner {
    Q_OBJECT

public:
    explicit WindowPointer(QWidget* window);

    // The shape of pointer 99; without one, pointer 99 shows the arrow.
    void setCustomCursor(const QCursor& cursor);
    bool hasCustomCursor() const { return m_custom.has_value(); }

    // A mouse move over control applies the hover rule with pointer.
    void watch(QWidget* control, int pointer);

    // A control without a hover rule: over it the pointer keeps its last
    // shape. Its moves must not reach the frame or window behind it either,
    // whose rule would otherwise apply there.
    void keepPointerOver(QWidget* control);

    int mousePointer() const override { return m_pointer; }
    void setMousePointer(int pointer) override;

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    QWidget* m_window;
    std::optional<QCursor> m_custom;
    int m_pointer = MousePointer::Default;
};
