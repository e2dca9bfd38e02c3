#pragma once

#include <QApplication>

class Dialogs;
struct Environment;

// The application object. Handlers without an error trap of their own (the
// start-up, option clicks, the count box, mouse moves, window loads) let
// their failures through to notify(), the one place that shows the closing
// notice and ends the program.
class QuillaneApplication : public QApplication {
    Q_OBJECT

public:
    QuillaneApplication(int& argc, char** argv);

    // Where the closing notice is shown; set before the first window.
    void setDialogs(Dialogs* dialogs) { m_dialogs = dialogs; }

    bool notify(QObject* receiver, QEvent* event) override;

    // Shows the notice for the failure being handled and ends the program
    // with a non-zero status. Call it only from a catch block.
    [[noreturn]] void endOnFailure();

private:
    Dialogs* m_dialogs = nullptr;
};

// Runs the program: builds the main window, runs its start-up sequence and
// then the event loop. Returns the process's exit status.
int runProgram(QuillaneApplication& app, Environment& environment);
