#pragma once

#include <QProcess>
#include <QString>

// Every filled cell of every sheet as openpyxl reads it, "A1 value" joined
// by commas, with the cell's type after the value when it is not text.
inline QString readWorkbook(const QString& path)
{
    QProcess python;
    python.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    python.start(QStringLiteral("/usr/bin/python3"),
                 {QStringLiteral("-c"), QString::fromUtf16(uR"py(import sys, openpyxl
sys.stdout.reconfigure(encoding="utf-8")
print(",".join(f"{c.coordinate} {c.value}" + ("" if c.data_type == "s" else f" ({c.data_type})")
    for s in openpyxl.load_workbook(sys.argv[1]).worksheets for r in s.iter_rows() for c in r
    if c.value is not None)))py"),
                  path});
    python.waitForFinished(60000);
    return QString::fromUtf8(python.readAllStandardOutput()).trimmed();
}
