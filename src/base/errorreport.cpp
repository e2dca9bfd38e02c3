#include "base/errorreport.h"

#include "base/dialogs.h"
#include "base/failure.h"

using namespace Qt::StringLiterals;

QString errorReportText(const QString& description, const QString& location, int line,
                        ClosingLine closing)
{
    const QString closingLine = closing == ClosingLine::Long
                                    ? u"Please email screenshot of this message to "_s
                                    : u"Please email "_s;
    return escapeControlCharacters(description) % u"\r\n"_s % location % u"at line "_s
           % QString::number(line) % u"\r\r"_s % closingLine % SupportAddress;
}

void ShowErrorReport(Dialogs& dialogs, const QString& description, const QString& location,
                     int line, ClosingLine closing)
{
    dialogs.messageBox(errorReportText(description, location, line, closing), ErrorReportTitle,
                       MessageIcon::Exclamation);
}
