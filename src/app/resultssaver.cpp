#include "app/resultssaver.h"

#include "base/dialogs.h"
#include "base/trap.h"
#include "results/resultrows.h"
#include "results/spreadsheet.h"
#include "results/textfile.h"

#include <QStandardPaths>

#include <optional>

using namespace Qt::StringLiterals;

namespace {
const QString Location = u"in Tessmark.Form2.PushButton2_Click "_s;
}

const QString ResultsSaver::SaveDialogTitle = u"Save File As"_s;
const QString ResultsSaver::SaveDialogFilter = u"Text Files (*.txt);;All Files (*)"_s;

ResultsSaver::ResultsSaver(Dialogs& dialogs, Shell& shell, QString cacheFolder,
                           QString namesDatabase)
    : m_dialogs(dialogs)
    , m_shell(shell)
    , m_cacheFolder(std::move(cacheFolder))
    , m_namesDatabase(std::move(namesDatabase))
{
    if (m_cacheFolder.isEmpty()) {
        m_cacheFolder =
            QStandardPaths::writableLocation(QStandardPaths::GenericCacheLocation) + u"/quillane"_s;
    }
}

void ResultsSaver::save(OutputChoice choice, const ResultRows& rows)
{
    if (choice == OutputChoice::TextFile)
        saveTextFile(rows);
    else
        saveSpreadsheet(choice, rows);
}

// Each step needs what the one before it made: after a failure the steps
// that follow are not tried, since going on would write a partial text over
// the user's file or report the same missing workbook once per row.
void ResultsSaver::saveTextFile(const ResultRows& rows)
{
    Trap trap(m_dialogs, Location, ClosingLine::Long);
    QString path;
    if (!trap(10, [&] { path = m_dialogs.saveFileName(SaveDialogTitle, SaveDialogFilter); }))
        return;
    if (path.isEmpty())
        return;
    QByteArray text;
    if (!trap(20, [&] { text = resultsText(rows); }))
        return;
    trap(30, [&] { WriteTextFile(text, path, m_namesDatabase); });
}

void ResultsSaver::saveSpreadsheet(OutputChoice choice, const ResultRows& rows)
{
    Trap trap(m_dialogs, Location, ClosingLine::Long);
    std::optional<SpreadsheetApplication> spreadsheet;
    if (!trap(110, [&] { spreadsheet.emplace(m_shell, m_cacheFolder); }))
        return;
    if (!trap(120, [&] { spreadsheet->Workbooks().Add(); }))
        return;
    // The whole fill is one step: a sheet that refuses a cell is reported
    // once, not once for every row after it.
    const bool filled =
        trap(130, [&] { fillSheet(spreadsheet->ActiveWorkbook().ActiveSheet(), choice, rows); });
    // A workbook missing rows after the one that failed is not shown: the
    // user would take it for the whole list.
    if (!filled)
        return;
    trap(140, [&] { spreadsheet->setVisible(true); });
}
