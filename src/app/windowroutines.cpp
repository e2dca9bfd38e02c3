#include "app/windowroutines.h"

#include <QCheckBox>
#include <QDir>
#include <QFileInfo>
#include <QGroupBox>
#include <QLabel>
#include <QRadioButton>
#include <QScreen>
#include <QWidget>

using namespace Qt::StringLiterals;

void CenterForm(QWidget* window)
{
    const QScreen* screen = window->screen();
    if (!screen)
        return;
    const QRect area = screen->geometry();
    const QRect frame = window->frameGeometry();
    const double left = area.left() + (area.width() - frame.width()) / 2.0;
    const double top = area.top() + (area.height() - frame.height()) / 2.0;
    window->move(int(left), int(top));
}

bool FileExists(const QString& path)
{
    if (path.isEmpty() || path.contains(QChar(u'\0')))
        return false;
    return QFileInfo::exists(path);
}

bool InDevelopment()
{
#ifdef NDEBUG
    return false;
#else
    return true;
#endif
}

void SetFormBackColor(QWidget* window)
{
    const auto paintButtonFace = [](QWidget* widget) {
        QPalette palette = widget->palette();
        palette.setColor(QPalette::Window, palette.color(QPalette::Button));
        widget->setPalette(palette);
        widget->setBackgroundRole(QPalette::Window);
        widget->setAutoFillBackground(true);
    };
    paintButtonFace(window);
    for (QWidget* child : window->findChildren<QWidget*>()) {
        if (qobject_cast<QGroupBox*>(child) || qobject_cast<QRadioButton*>(child)
            || qobject_cast<QCheckBox*>(child) || qobject_cast<QLabel*>(child))
            paintButtonFace(child);
    }
}

QString cursorFilePath(const QString& programFolder)
{
    return QDir(programFolder).filePath(u"HAND-M.CUR"_s);
}

std::optional<QCursor> loadCursorFile(const QString& path)
{
    Q_UNUSED(path);
    return std::nullopt;
}
