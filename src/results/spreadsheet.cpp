#include "results/spreadsheet.h"

#include "base/failure.h"
#include "base/shell.h"
#include "results/resultrows.h"
#include "results/workbookcache.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringEncoder>
#include <QTemporaryFile>

#include <xlsxwriter.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <utility>

#include <sys/stat.h>

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

// What a newly made file may be: read and write for all, less the umask.
QFileDevice::Permissions newFilePermissions()
{
    const mode_t mask = ::umask(0);
    ::umask(mask);
    QFileDevice::Permissions permissions;
    const std::pair<mode_t, QFileDevice::Permissions> bits[] = {
        {S_IRUSR, QFileDevice::ReadOwner | QFileDevice::ReadUser},
        {S_IWUSR, QFileDevice::WriteOwner | QFileDevice::WriteUser},
        {S_IRGRP, QFileDevice::ReadGroup},
        {S_IWGRP, QFileDevice::WriteGroup},
        {S_IROTH, QFileDevice::ReadOther},
        {S_IWOTH, QFileDevice::WriteOther}};
    for (const auto& [bit, permission] : bits) {
        if (!(mask & bit))
            permissions |= permission;
    }
    return permissions;
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

void fillSheet(Worksheet& sheet, OutputChoice layout, const ResultRows& rows)
{
    const int count = rows.rowCount();
    for (int row = 0; row < count; ++row) {
        if (layout == OutputChoice::SpreadsheetTwoCells) {
            sheet.cells(row + 1, 1) = rows.firstName(row);
            sheet.cells(row + 1, 2) = rows.lastName(row);
        } else {
            sheet.cells(row + 1, 1) = rows.firstName(row) + u' ' + rows.lastName(row);
        }
    }
}

WorkbookFile::WorkbookFile(const QString& folder)
    : m_folder(folder)
    , m_sheet(nullptr)
{
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
    m_book = workbook_new_opt(fileName.constData(), &options);
    if (!m_book) {
        discard();
        throw Failure(u"The workbook could not be made (out of memory)"_s);
    }
    m_sheet.m_sheet = workbook_add_worksheet(m_book, nullptr);
    if (!m_sheet.m_sheet) {
        discard();
        throw Failure(u"The workbook could not be given a sheet"_s);
    }
}

WorkbookFile::~WorkbookFile()
{
    discard();
}

void WorkbookFile::discard()
{
    if (m_book) {
        lxw_workbook_free(m_book);
        m_book = nullptr;
    }
    if (!m_partPath.isEmpty()) {
        QFile::remove(m_partPath);
        m_partPath.clear();
    }
}

void WorkbookFile::close()
{
    if (!m_book)
        throw Failure(u"The workbook is already closed"_s);
    // Closing writes the file and frees the workbook, whatever its outcome.
    const lxw_error closed = workbook_close(m_book);
    m_book = nullptr;
    if (closed != LXW_NO_ERROR) {
        const QString where = QDir::toNativeSeparators(m_partPath);
        discard();
        throw writerFailure(closed, where);
    }
}

bool WorkbookFile::moveTo(const QString& path, bool replace)
{
    if (m_book || m_partPath.isEmpty())
        throw Failure(u"The workbook is not complete"_s);
    if (!replace) {
        // QFile never replaces a file in renaming.
        if (!QFile::rename(m_partPath, path))
            return false;
        m_partPath.clear();
        return true;
    }
    // The hidden file was made for its owner alone; the finished one gets
    // the permissions of the file it replaces, or those of a new file.
    const QFileInfo target(path);
    QFile::setPermissions(m_partPath,
                          target.exists() ? target.permissions() : newFilePermissions());
    if (std::rename(QFile::encodeName(m_partPath).constData(), QFile::encodeName(path).constData())
        != 0) {
        const QString reason = QString::fromLocal8Bit(std::strerror(errno));
        discard();
        throw Failure(
            u"The file %1 could not be saved: %2"_s.arg(QDir::toNativeSeparators(path), reason));
    }
    m_partPath.clear();
    return true;
}

Workbook::Workbook(const QString& folder)
    : m_file(folder)
{
}

Worksheet& Workbook::ActiveSheet()
{
    return m_file.sheet();
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
    removeOldWorkbooks(m_folder, QDateTime::currentDateTime());
}

SpreadsheetApplication::~SpreadsheetApplication() = default;

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
    m_active.reset(new Workbook(m_folder));
    return *m_active;
}

void SpreadsheetApplication::setVisible(bool visible)
{
    if (!visible || m_visible)
        return;
    if (!m_active)
        throw Failure(u"There is no workbook to show"_s);

    // Whatever happens from here on, the workbook is done with: a failure
    // takes its unfinished file with it.
    const std::unique_ptr<Workbook> book = std::move(m_active);
    WorkbookFile& file = book->m_file;
    file.close();

    // Named for the moment it is shown; a second one in the same second is
    // told apart by a number. The rename never replaces an existing file.
    const QString stem =
        u"Quillane names "_s + QDateTime::currentDateTime().toString(u"yyyy-MM-dd HH.mm.ss"_s);
    QDir folder(m_folder);
    QString documentPath;
    for (int n = 1; documentPath.isEmpty(); ++n) {
        const QString candidate =
            folder.filePath(n == 1 ? stem + u".xlsx"_s : u"%1 (%2).xlsx"_s.arg(stem).arg(n));
        if (file.moveTo(candidate, false))
            documentPath = candidate;
        else if (!QFileInfo::exists(candidate) || n >= 1000)
            throw Failure(u"The workbook could not be given its name %1"_s.arg(
                QDir::toNativeSeparators(candidate)));
    }

    try {
        m_shell.openDocument(documentPath);
    } catch (...) {
        QFile::remove(documentPath);
        throw;
    }
    m_documentPath = documentPath;
    m_visible = true;
}
