#include "app/windowroutines.h"

#include "base/cursorfile.h"

#include <QCheckBox>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QGroupBox>
#include <QLabel>
#include <QPixmap>
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

QString skinFilePath(const QString& programFolder)
{
    return QDir(programFolder).filePath(u"x/o.cjs"_s);
}

bool ApplySkin(QWidget* form, const QString& programFolder)
{
    const QString path = skinFilePath(programFolder);
    const QFileInfo info(path);
    if (!info.isFile() || !info.isReadable() || info.isHidden())
        return false;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return false;
    const QString styleSheet = QString::fromUtf8(file.readAll());
    if (file.error() != QFileDevice::NoError)
        return false;

    SetFormBackColor(form);
    form->setStyleSheet(styleSheet);
    return true;
}

QString cursorFilePath(const QString& programFolder)
{
    return QDir(programFolder).filePath(u"HAND-M.CUR"_s);
}

std::optional<QCursor> loadCursorFile(const QString& path)
{
    // A cursor is a few kilobytes; anything far larger is not one.
    constexpr qint64 MaxCursorFileSize = 1 << 20;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly) || file.size() > MaxCursorFileSize)
        return std::nullopt;
    const std::optional<CursorPicture> picture = readCursorFile(file.readAll());
    if (!picture)
        return std::nullopt;
    return QCursor(QPixmap::fromImage(picture->image), picture->hotSpot.x(), picture->hotSpot.y());
}
