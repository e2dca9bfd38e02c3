#pragma once

#include <QProcess>
#include <QString>

// Workbooks are read back by an independent reader, openpyxl, run by the
// system's python3.
inline const QString WorkbookReader = QStringLiteral("/usr/bin/python3");

// Whether the reader runs here; asked once per test program.
inline bool workbookReaderFound()
{
    static const bool found = [] {
        QProcess python;
        python.start(WorkbookReader, {QStringLiteral("-c"), QStringLiteral("import openpyxl")});
        return python.waitForFinished(60000) && python.exitStatus() == QProcess::NormalExit
               && python.exitCode() == 0;
    }();
    return found;
}

// In a test function: skips the rest of it, saying why, where no reader runs.
#define SKIP_WITHOUT_WORKBOOK_READER()                                                             \
    do {                                                                                           \
        if (!workbookReaderFound())                                                                \
            QSKIP("No reader for workbooks: install python3-openpyxl (for /usr/bin/python3)");     \
    } while (false)

// Every filled cell of every sheet as openpyxl reads it, "A1 value" joined
// by commas, with the cell's type after the value when it is not text.
inline QString readWorkbook(const QString& path)
{
    QProcess python;
    python.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    python.start(WorkbookReader,
                 {QStringLiteral("-c"), QString::fromUtf16(uR"py(import sys, openpyxl
sys.stdout.reconfigure(encoding="utf-8")
print(",".join(f"{c.coordinate} {c.value}" + ("" if c.data_type == "s" else f" ({c.data_type})")
    for s in openpyxl.load_workbook(sys.argv[1]).worksheets for r in s.iter_rows() for c in r
    if c.value is not None)))py"),
                  path});
    python.waitForFinished(60000);
    return QString::fromUtf8(python.readAllStandardOutput()).trimmed();
}
