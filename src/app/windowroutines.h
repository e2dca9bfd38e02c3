#pragma once

#include "base/programfiles.h"

#include <QCursor>
#include <QString>

#include <optional>

class QWidget;

// Small routines that several windows share.

// Places the window's outer frame in the middle of the screen that holds it.
void CenterForm(QWidget* window);

// Gives the window, and its frames, option buttons, check boxes and labels,
// the button-face background of the palette.
void SetFormBackColor(QWidget* window);

// The skin file below the program folder: a Qt style sheet.
QString skinFilePath(const QString& programFolder);

// Skins the main window when the skin file is there: the window and its
// frames, option buttons, check boxes and labels get the button-face
// background, then the style sheet is applied. A skin path that is not a
// regular, readable file counts as absent and leaves the window as it is.
// Returns whether the skin was applied.
bool ApplySkin(QWidget* form, const QString& programFolder);

// The hover cursor file beside the executable.
QString cursorFilePath(const QString& programFolder);

// Loads a cursor file (the icon container with a hotspot); nothing when the
// file cannot be read as one.
std::optional<QCursor> loadCursorFile(const QString& path);
