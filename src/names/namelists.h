#pragma once

#include "names/listchoice.h"
#include "names/panemodel.h"

#include <QString>

// The two list panes of the main window and their filling from the names
// database. The panes are the working set of generation; the database is
// only read here. A window shows the hourglass while they fill.
class NameLists {
public:
    explicit NameLists(QString databasePath);

    PaneModel& firstPane() { return m_firstPane; }
    PaneModel& lastPane() { return m_lastPane; }
    const QString& databasePath() const { return m_databasePath; }

    // Rebuilds both panes from the database for the chosen source and gender.
    // A pane is replaced only once its query has succeeded, so a failing query
    // leaves that pane as it was; a group with no option selected leaves its
    // panes as they are. Throws Failure.
    void RefreshLists(const ListChoice& choice);

private:
    QString m_databasePath;
    PaneModel m_firstPane;
    PaneModel m_lastPane;
};
