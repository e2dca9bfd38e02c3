#pragma once

#include "base/errorreport.h"
#include "names/listchoice.h"
#include "names/liststore.h"

#include <QString>

#include <functional>

class Dialogs;
class NameLists;
class PointerOwner;

// The main window's add, delete and import buttons. Each handler runs the
// list operation (names/listoperations.h) under its error trap, as numbered
// steps, and ends by rebuilding both panes from the database under the
// hourglass.
//
// The source and gender are read from the window at the moment of the
// click, through the callback.
class ListEditor {
public:
    ListEditor(Dialogs& dialogs, QString databasePath, NameLists& lists, PointerOwner& window,
               std::function<ListChoice()> choice);

    // "Add First Name", "Add Last Name": one typed name into the list.
    void PushButton2_Click();
    void PushButton5_Click();

    // The first names' and the last names' "Delete" or "Clear". The row is
    // the selected row of the button's pane, or -1 for none.
    void PushButton4_Click(int selectedRow);
    void PushButton3_Click(int selectedRow);

    // "Load First Names From File", "Load Last Names From File".
    void PushButton6_Click();
    void PushButton7_Click();

    // Imports one text file's names into the chosen list, under its own
    // trap and over its own connection.
    void FileToListview(const QString& path, ListKind kind);

    // A file with more rejected names than this reports the first ones and
    // then, once, how many more were rejected.
    static constexpr int MaxReportsPerFile = MaxImportReportsPerFile;

private:
    void addName(ListKind kind, const QString& location, const QString& prompt);
    void deleteNames(ListKind kind, int selectedRow, const QString& location, ClosingLine closing);
    void importFiles(ListKind kind, const QString& location);
    void refreshLists(const ListChoice& choice);

    Dialogs& m_dialogs;
    QString m_databasePath;
    NameLists& m_lists;
    PointerOwner& m_window;
    std::function<ListChoice()> m_choice;
};
