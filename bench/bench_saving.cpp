// Times saving 1,000,001 results: the text file (building the text and
// writing it), and the workbook (building and writing it, without starting
// a spreadsheet program), with the growth of the peak memory it needs.
#include "base/shell.h"
#include "benchsupport.h"
#include "results/resultrows.h"
#include "results/spreadsheet.h"
#include "results/textfile.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <random>
#include <vector>

using namespace Qt::StringLiterals;

namespace {

constexpr int Rows = 1'000'001;
constexpr double TextLimitMs = 300;
constexpr double WorkbookLimitMs = 4000;
constexpr double WorkbookLimitMB = 64;

class GeneratedRows : public ResultRows {
public:
    explicit GeneratedRows(int count)
    {
        std::mt19937 random(11);
        std::uniform_int_distribution<int> length(3, 9);
        std::uniform_int_distribution<int> letter('a', 'z');
        const auto name = [&] {
            QString text(length(random), u'a');
            for (QChar& c : text)
                c = QChar(letter(random));
            text[0] = text[0].toUpper();
            return text;
        };
        m_first.reserve(count);
        m_last.reserve(count);
        for (int i = 0; i < count; ++i) {
            m_first.push_back(name());
            m_last.push_back(name());
        }
    }
    int rowCount() const override { return int(m_first.size()); }
    QString firstName(int row) const override { return m_first[size_t(row)]; }
    QString lastName(int row) const override { return m_last[size_t(row)]; }

private:
    std::vector<QString> m_first;
    std::vector<QString> m_last;
};

const char* verdict(bool ok)
{
    return ok ? "ok" : "OVER LIMIT";
}

} // namespace

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    QTemporaryDir dir;
    const GeneratedRows rows(Rows);

    // The workbook first, so that its peak is measured before the text's.
    const long peakBefore = Bench::peakKilobytes();
    QElapsedTimer timer;
    timer.start();
    const double workbookCpuStart = Bench::processorMs();
    QString document;
    {
        Bench::NoShell shell;
        SpreadsheetApplication spreadsheet(shell, dir.path());
        spreadsheet.Workbooks().Add();
        Worksheet& sheet = spreadsheet.ActiveWorkbook().ActiveSheet();
        for (int row = 0; row < rows.rowCount(); ++row) {
            sheet.cells(row + 1, 1) = rows.firstName(row);
            sheet.cells(row + 1, 2) = rows.lastName(row);
        }
        spreadsheet.setVisible(true);
        document = spreadsheet.documentPath();
    }
    const double workbookMs = double(timer.nsecsElapsed()) / 1e6;
    const double workbookCpuMs = Bench::processorMs() - workbookCpuStart;
    const double workbookMB = double(Bench::peakKilobytes() - peakBefore) / 1024.0;
    std::printf("workbook (2 cells), %d rows: %.0f ms (limit %.0f) %s, %.0f ms of CPU; "
                "peak memory +%.1f MB (limit %.0f) %s; file %.1f MB\n",
                Rows, workbookMs, WorkbookLimitMs, verdict(workbookMs <= WorkbookLimitMs),
                workbookCpuMs, workbookMB, WorkbookLimitMB, verdict(workbookMB <= WorkbookLimitMB),
                double(QFileInfo(document).size()) / 1e6);

    const QString path = dir.filePath(u"names.txt"_s);
    std::vector<double> times;
    std::vector<double> cpu;
    std::vector<double> building;
    for (int run = 0; run < 5; ++run) {
        timer.start();
        const double cpuStart = Bench::processorMs();
        const QByteArray text = resultsText(rows);
        building.push_back(double(timer.nsecsElapsed()) / 1e6);
        WriteTextFile(text, path, QString());
        times.push_back(double(timer.nsecsElapsed()) / 1e6);
        cpu.push_back(Bench::processorMs() - cpuStart);
    }
    std::sort(times.begin(), times.end());
    std::sort(cpu.begin(), cpu.end());
    std::sort(building.begin(), building.end());
    std::printf("text file, %d rows: median %.0f ms, best %.0f ms (limit %.0f) %s; "
                "median %.0f ms of CPU, %.0f ms building the text; file %.1f MB\n",
                Rows, times[2], times[0], TextLimitMs, verdict(times[2] <= TextLimitMs), cpu[2],
                building[2], double(QFileInfo(path).size()) / 1e6);
    return workbookMs <= WorkbookLimitMs && workbookMB <= WorkbookLimitMB && times[2] <= TextLimitMs
               ? 0
               : 1;
}
