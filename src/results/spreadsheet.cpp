#include "results/spreadsheet.h"

#include "app/failure.h"
#include "app/shell.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringEncoder>
#include <QTemporaryFile>

#include <xlsxwriter.h>

using namespace Qt::StringLiterals;

namespace {

QString cellName(int row, int column)
{
    QString letters;
    for (int n = column; n > 0; n = (n - 1) / 26)
        letters.prepend(QChar(u'A' + (n - 1) % 26));
    return letters + QString::number(row);
}

Failure writerFailure(lxw_error error, const QString& where = {})
{
    const QString text = QString::fromUtf8(lxw_strerror(error));
    return Failure(where.isEmpty() ? text : u"%1 (%2)"_s.arg(text, where));
}

} // namespace

SpreadsheetCell::SpreadsheetCell(Worksheet& sheet, int row, int column)
    : m_sheet(sheet)
    , m_row(row)
    , m_column(column)
{
}

SpreadsheetCell& SpreadsheetCell::operator=(const QString& text)
{
    if (m_row < 1 || m_column < 1)
        throw Failure(u"There is no cell at row %1, column %2"_s.arg(m_row).arg(m_column));
    QByteArray& utf8 = m_sheet.m_utf8;
    QStringEncoder encoder(QStringEncoder::Utf8, QStringEncoder::Flag::Stateless);
    utf8.resize(encoder.requiredSpace(text.size()) + 1);
    char* end = encoder.appendToBuffer(utf8.data(), text);
    *end = '\0';
    const lxw_error error = worksheet_write_string(
        m_sheet.m_sheet, lxw_row_t(m_row - 1), lxw_col_t(m_column - 1), utf8.constData(), nullptr);
    if (error != LXW_NO_ERROR)
        throw writerFailure(error, u"cell "_s + cellName(m_row, m_column));
    return *this;
}

Worksheet::Worksheet(lxw_worksheet* sheet)
    : m_sheet(sheet)
{
}

SpreadsheetCell Worksheet::cells(int row, int column)
{
    return SpreadsheetCell(*this, row, column);
}

Workbook::Workbook(lxw_workbook* book, lxw_worksheet* sheet)
    : m_book(book)
    , m_sheet(sheet)
{
}

Worksheet& Workbook::ActiveSheet()
{
    return m_sheet;
}

WorkbookCollection::WorkbookCollection(SpreadsheetApplication& application)
    : m_application(application)
{
}

Workbook& WorkbookCollection::Add()
{
    return m_application.addWorkbook();
}

SpreadsheetApplication::SpreadsheetApplication(Shell& shell, QString folder)
    : m_shell(shell)
    , m_folder(std::move(folder))
    , m_workbooks(*this)
{
    if (!QDir().mkpath(m_folder))
        throw Failure(u"The folder %1 could not be made"_s.arg(QDir::toNativeSeparators(m_folder)));
}

SpreadsheetApplication::~SpreadsheetApplication()
{
    discardWorkbook();
}

Workbook& SpreadsheetApplication::ActiveWorkbook()
{
    if (!m_active)
        throw Failure(u"There is no workbook"_s);
    return *m_active;
}

Workbook& SpreadsheetApplication::addWorkbook()
{
    if (m_active || m_visible)
        throw Failure(u"The spreadsheet already holds a workbook"_s);

    // The workbook is built under a hidden name of its own and gets its
    // real name only when it is complete: a failure halfway leaves nothing
    // that looks like a workbook of names.
    QTemporaryFile part(QDir(m_folder).filePath(u".Quillane names XXXXXX.xlsx.part"_s));
    part.setAutoRemove(false);
    if (!part.open())
        throw Failure(u"No workbook can be made in %1: %2"_s.arg(QDir::toNativeSeparators(m_folder),
                                                                 part.errorString()));
    m_partPath = part.fileName();
    part.close();

    const QByteArray fileName = QFile::encodeName(m_partPath);
    // Rows go to a temporary file as they are written instead of staying in
    // memory; it sits beside the workbook rather than in /tmp, which may be
    // held in memory itself.
    QByteArray tmpdir = QFile::encodeName(m_folder);
    lxw_workbook_options options{};
    options.constant_memory = LXW_TRUE;
    options.tmpdir = tmpdir.data();
    lxw_workbook* book = workbook_new_opt(fileName.constData(), &options);
    if (!book) {
        QFile::remove(m_partPath);
        m_partPath.clear();
        throw Failure(u"The workbook could not be made (out of memory)"_s);
    }
    lxw_worksheet* sheet = workbook_add_worksheet(book, nullptr);
    if (!sheet) {
        lxw_workbook_free(book);
        QFile::remove(m_partPath);
        m_partPath.clear();
        throw Failure(u"The workbook could not be given a sheet"_s);
    }
    m_active.reset(new Workbook(book, sheet));
    return *m_active;
}

void SpreadsheetApplication::discardWorkbook()
{
    if (m_active) {
        lxw_workbook_free(m_active->m_book);
        m_active.reset();
    }
    if (!m_partPath.isEmpty()) {
        QFile::remove(m_partPath);
        m_partPath.clear();
    }
}

void SpreadsheetApplication::setVisible(bool visible)
{
    if (!visible || m_visible)
        return;
    if (!m_active)
        throw Failure(u"There is no workbook to show"_s);

    // Closing writes the file and frees the workbook, whatever its outcome.
    const lxw_error closed = workbook_close(m_active->m_book);
    m_active.reset();
    if (closed != LXW_NO_ERROR) {
        const QString where = QDir::toNativeSeparators(m_partPath);
        discardWorkbook();
        throw writerFailure(closed, where);
    }

    // Named for the moment it is shown; a second one in the same second is
    // told apart by a number. The rename never replaces an existing file.
    const QString stem =
        u"Quillane names "_s + QDateTime::currentDateTime().toString(u"yyyy-MM-dd HH.mm.ss"_s);
    QDir folder(m_folder);
    QString documentPath;
    for (int n = 1; documentPath.isEmpty(); ++n) {
        const QString candidate =
            folder.filePath(n == 1 ? stem + u".xlsx"_s : u"%1 (%2).xlsx"_s.arg(stem).arg(n));
        if (QFile::rename(m_partPath, candidate))
            documentPath = candidate;
        else if (!QFileInfo::exists(candidate) || n >= 1000) {
            discardWorkbook();
            throw Failure(u"The workbook could not be given its name %1"_s.arg(
                QDir::toNativeSeparators(candidate)));
        }
    }
    m_partPath.clear();

    try {
        m_shell.openDocument(documentPath);
    } catch (...) {
        QFile::remove(documentPath);
        throw;
    }
    m_documentPath = documentPath;
    m_visible = true;
}
