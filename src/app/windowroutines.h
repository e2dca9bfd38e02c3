#pragma once

#include <QCursor>
#include <QString>

#include <optional>

class QWidget;

// Small routines that several windows share.

// Places the window's outer frame in the middle of the screen that holds it.
void CenterForm(QWidget* window);

// True only for a path that exists; an empty or malformed path is false.
bool FileExists(const QString& path);

// True in a debug build, where pauses are shortened.
bool InDevelopment();

// Gives the window, and its frames, option buttons, check boxes and labels,
// the button-face background of the palette.
void SetFormBackColor(QWidget* window);

// The hover cursor file beside the executable.
QString cursorFilePath(const QString& programFolder);

// Loads a cursor file (the icon container with a hotspot); nothing when the
// file cannot be read as one.
std::optional<QCursor> loadCursorFile(const QString& path);
