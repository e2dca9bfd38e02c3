#pragma once

#include <QString>

class Dialogs;

enum class ClosingLine { Long, Short };

inline const QString SupportAddress = QStringLiteral("support@quillane.org");
inline const QString ErrorReportTitle = QStringLiteral("Application Error");

// The text of the error report: the failure's description (its control
// characters escaped, since it may quote a file's content), CR LF, the
// handler's location text (which ends in a blank), "at line " and the number,
// two CRs, and the closing line that asks for a screenshot.
QString errorReportText(const QString& description, const QString& location, int line,
                        ClosingLine closing);

// Shows the report titled ErrorReportTitle with the exclamation icon and
// returns when the user has dismissed it.
void ShowErrorReport(Dialogs& dialogs, const QString& description, const QString& location,
                     int line, ClosingLine closing);
