#pragma once

#include <QString>
#include <QStringList>

// The program's one title: the main window's, and that of every message box
// and input box that is given no title of its own.
inline const QString ApplicationTitle = QStringLiteral("Quillane");

enum class MessageIcon { None, Exclamation, Critical };

// Every modal interaction of the program. The windows get the Qt
// implementation; tests get a scripted fake that records what was shown and
// answers from a queue, so no test ever waits on a real dialog.
class Dialogs {
public:
    virtual ~Dialogs() = default;

    // A message with only an OK button. Line breaks may be CR, LF or CR LF.
    virtual void messageBox(const QString& text, const QString& title, MessageIcon icon) = 0;

    // A prompt with a text field, OK and Cancel. Cancel answers "".
    virtual QString inputBox(const QString& prompt, const QString& title) = 0;

    // The open dialog with several files allowed. The answer lists the chosen
    // files as full paths in the dialog's order; cancel answers an empty list.
    // filter uses Qt's form: "Text Files (*.txt);;All Files (*)".
    virtual QStringList openFileNames(const QString& title, const QString& filter) = 0;

    // The save dialog, with no default suffix and no question before an
    // existing file is replaced. Cancel answers "".
    virtual QString saveFileName(const QString& title, const QString& filter) = 0;
};

// A refusal of the user's request: OK only, no icon, the program's title.
inline void refuse(Dialogs& dialogs, const QString& text)
{
    dialogs.messageBox(text, ApplicationTitle, MessageIcon::None);
}
