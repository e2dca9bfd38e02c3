#pragma once

#include "results/outputchoice.h"

#include <QString>

class Dialogs;
class ResultRows;
class Shell;

// "Start Saving Results" on the results window: writes the results list as
// a text file the user names, or hands it to the desktop's spreadsheet
// program in a new workbook, with two cells or one cell per row.
class ResultsSaver {
public:
    // cacheFolder: where workbooks are put for the spreadsheet program;
    // empty means the user's cache folder for this program. namesDatabase:
    // the file that no save may replace (empty for none).
    ResultsSaver(Dialogs& dialogs, Shell& shell, QString cacheFolder, QString namesDatabase = {});

    // The whole work of the button, under its error trap: every failure is
    // reported once, and the steps that need what failed are not tried.
    // A cancelled save dialog is no failure: nothing happens.
    void save(OutputChoice choice, const ResultRows& rows);

    static const QString SaveDialogTitle;
    static const QString SaveDialogFilter;

private:
    void saveTextFile(const ResultRows& rows);
    void saveSpreadsheet(OutputChoice choice, const ResultRows& rows);

    Dialogs& m_dialogs;
    Shell& m_shell;
    QString m_cacheFolder;
    QString m_namesDatabase;
};
