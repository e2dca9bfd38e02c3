#pragma once

#include "base/dialogs.h"

// The real dialogs, modal over the program's active window.
class QtDialogs : public Dialogs {
public:
    void messageBox(const QString& text, const QString& title, MessageIcon icon) override;
    QString inputBox(const QString& prompt, const QString& title) override;
    QStringList openFileNames(const QString& title, const QString& filter) override;
    QString saveFileName(const QString& title, const QString& filter) override;
};
