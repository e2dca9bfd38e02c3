#include "app/windowpointer.h"

#include <QAbstractScrollArea>
#include <QEvent>
#include <QGuiApplication>
#include <QWidget>

namespace {
const char* const HoverPointer = "quillaneHoverPointer";
}

WindowPointer::WindowPointer(QWidget* window)
    : QObject(window)
    , m_window(window)
{
}

void WindowPointer::setCustomCursor(const QCursor& cursor)
{
    m_custom = cursor;
    if (m_pointer == MousePointer::Custom)
        setMousePointer(m_pointer);
}

void WindowPointer::watch(QWidget* control, int pointer)
{
    // A list view receives its mouse moves on its viewport.
    QWidget* target = control;
    if (auto* area = qobject_cast<QAbstractScrollArea*>(control))
        target = area->viewport();
    target->setMouseTracking(true);
    target->setProperty(HoverPointer, pointer);
    // A move over a control is the control's alone; it must not reach the
    // frame or window behind it, whose rule would undo the control's.
    if (target != m_window)
        target->setAttribute(Qt::WA_NoMousePropagation);
    target->installEventFilter(this);
}

void WindowPointer::keepPointerOver(QWidget* control)
{
    control->setAttribute(Qt::WA_NoMousePropagation);
}

void WindowPointer::setMousePointer(int pointer)
{
    m_pointer = pointer;
    switch (pointer) {
    case MousePointer::Hourglass:
        m_window->setCursor(Qt::WaitCursor);
        // The long operation that follows does not return to the event
        // loop, which would otherwise be what hands the change to the
        // display server.
        QGuiApplication::sync();
        break;
    case MousePointer::Custom:
        m_window->setCursor(m_custom.value_or(QCursor(Qt::ArrowCursor)));
        break;
    default:
        m_window->unsetCursor();
        break;
    }
}

bool WindowPointer::eventFilter(QObject* watched, QEvent* event)
{
    if (event->type() == QEvent::MouseMove) {
        const QVariant pointer = watched->property(HoverPointer);
        if (pointer.isValid())
            applyHoverRule(*this, pointer.toInt());
    }
    return QObject::eventFilter(watched, event);
}
