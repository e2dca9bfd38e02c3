#include "results/spreadsheet.h"

#include "base/failure.h"
#include "base/safefile.h"
#include "base/shell.h"
#include "results/resultrows.h"
#include "results/resultsfile.h"
#include "results/workbookcache.h"

#include <QCoreApplication>
#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringEncoder>

#include <xlsxwriter.h>

#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <utility>

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

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

// libxlsxwriter prints its own [ERROR] lines on standard error; the
// failure it returns is reported to the user instead, once. For the time
// it works, standard error goes nowhere.
class QuietStandardError {
public:
    QuietStandardError()
    {
        std::fflush(stderr);
        m_saved = ::fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, 0);
        const int null = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
        if (m_saved >= 0 && null >= 0)
            ::dup2(null, STDERR_FILENO);
        if (null >= 0)
            ::close(null);
    }
    ~QuietStandardError()
    {
        std::fflush(stderr);
        if (m_saved >= 0) {
            ::dup2(m_saved, STDERR_FILENO);
            ::close(m_saved);
        }
    }
    QuietStandardError(const QuietStandardError&) = delete;
    QuietStandardError& operator=(const QuietStandardError&) = delete;

private:
    int m_saved = -1;
};

// The failures of libxlsxwriter that come from the file system, whose own
// description (errno) says more than the library's.
bool fromTheFileSystem(lxw_error error)
{
    switch (error) {
    case LXW_ERROR_CREATING_XLSX_FILE:
    case LXW_ERROR_CREATING_TMPFILE:
    case LXW_ERROR_READING_TMPFILE:
    case LXW_ERROR_ZIP_FILE_OPERATION:
    case LXW_ERROR_ZIP_FILE_ADD:
    case LXW_ERROR_ZIP_CLOSE:
        return true;
    default:
        return false;
    }
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

WorkbookFile::WorkbookFile(std::unique_ptr<SafeFile> file)
    : m_file(std::move(file))
    , m_sheet(nullptr)
{
    QString target = m_file->temporaryPath();
    if (target.isEmpty()) {
        // Named as any temporary file of ours, so that one left by a kill
        // is removed in time; never given its final name.
        m_staging = std::make_unique<SafeFile>(
            QDir(QDir::tempPath())
                .filePath(u"quillane-workbook-%1.xlsx"_s.arg(QCoreApplication::applicationPid())),
            SafeFile::Mode::CreateNew);
        target = m_staging->temporaryPath();
    }

    const QByteArray fileName = QFile::encodeName(target);
    // Rows go to a temporary file as they are written instead of staying in
    // memory; it sits beside the file being written rather than in a /tmp
    // that may be held in memory itself.
    QByteArray tmpdir = QFile::encodeName(QFileInfo(target).absolutePath());
    lxw_workbook_options options{};
    options.constant_memory = LXW_TRUE;
    options.tmpdir = tmpdir.data();
    {
        QuietStandardError quiet;
        m_book = workbook_new_opt(fileName.constData(), &options);
        if (m_book)
            m_sheet.m_sheet = workbook_add_worksheet(m_book, nullptr);
    }
    if (!m_book)
        throw Failure(u"The workbook could not be made (out of memory)"_s);
    if (!m_sheet.m_sheet) {
        discard();
        throw Failure(u"The workbook could not be given a sheet"_s);
    }
}

WorkbookFile::~WorkbookFile()
{
    discard();
}

const QString& WorkbookFile::path() const
{
    return m_file->path();
}

void WorkbookFile::discard()
{
    if (m_book) {
        QuietStandardError quiet;
        lxw_workbook_free(m_book);
        m_book = nullptr;
    }
}

void WorkbookFile::save()
{
    if (!m_book)
        throw Failure(u"The workbook is already closed"_s);
    const auto fail = [this](const QString& reason) {
        return Failure(u"The file %1 could not be saved: %2"_s.arg(
            QDir::toNativeSeparators(m_file->path()), reason));
    };
    // The rows written so far wait in a temporary file, whose write errors
    // libxlsxwriter does not check: a full disk would drop rows from the
    // sheet without a word.
    if (FILE* rows = m_sheet.m_sheet->optimize_tmpfile) {
        errno = 0;
        if (std::fflush(rows) != 0 || std::ferror(rows)) {
            const int error = errno != 0 ? errno : EIO;
            discard();
            throw fail(QString::fromLocal8Bit(std::strerror(error)));
        }
        // Closing copies those rows into the sheet, again unchecked, and
        // zips the sheet while the copy exists: on a disk that fills up
        // halfway the workbook would lose rows and still be written. So
        // the room for both is there first, or it is a full disk now.
        struct stat info {};
        if (::fstat(::fileno(rows), &info) == 0) {
            const auto needed = std::uintmax_t(info.st_size) * 2 + (1u << 20);
            struct statvfs disk {};
            if (::fstatvfs(::fileno(rows), &disk) == 0
                && std::uintmax_t(disk.f_bavail) * disk.f_frsize < needed) {
                discard();
                throw fail(QString::fromLocal8Bit(std::strerror(ENOSPC)));
            }
            // The sheet is the largest file, a little more than the rows.
            rlimit limit{};
            if (::getrlimit(RLIMIT_FSIZE, &limit) == 0 && limit.rlim_cur != RLIM_INFINITY
                && limit.rlim_cur < std::uintmax_t(info.st_size) + (1u << 16)) {
                discard();
                throw fail(QString::fromLocal8Bit(std::strerror(EFBIG)));
            }
        }
    }
    // Closing writes the file and frees the workbook, whatever its outcome.
    lxw_error closed;
    int error;
    {
        QuietStandardError quiet;
        errno = 0;
        closed = workbook_close(m_book);
        error = errno;
    }
    m_book = nullptr;
    if (closed != LXW_NO_ERROR) {
        throw fail(fromTheFileSystem(closed) && error != 0
                       ? QString::fromLocal8Bit(std::strerror(error))
                       : QString::fromUtf8(lxw_strerror(closed)));
    }

    if (m_staging) {
        // A device or a FIFO gets the finished workbook's bytes.
        QFile staged(m_staging->temporaryPath());
        if (!staged.open(QIODevice::ReadOnly))
            throw fail(staged.errorString());
        QByteArray chunk;
        do {
            chunk = staged.read(1 << 20);
            m_file->write(chunk);
        } while (!chunk.isEmpty());
        if (staged.error() != QFileDevice::NoError)
            throw fail(staged.errorString());
    }
    m_file->commit();
}

void saveWorkbook(const ResultRows& rows, OutputChoice layout, const QString& path,
                  const QString& namesDatabase)
{
    WorkbookFile book(openResultsFile(path, namesDatabase));
    fillSheet(book.sheet(), layout, rows);
    book.save();
}

Workbook::Workbook(const QString& path)
    : m_file(std::make_unique<SafeFile>(path, SafeFile::Mode::CreateNew))
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

// The one place a workbook for the desktop's program is named and made. It
// is named for the moment it is made; a second one in the same second is
// told apart by a number.
Workbook& SpreadsheetApplication::addWorkbook()
{
    if (m_active || m_visible)
        throw Failure(u"The spreadsheet already holds a workbook"_s);
    const QString stem =
        u"Quillane names "_s + QDateTime::currentDateTime().toString(u"yyyy-MM-dd HH.mm.ss"_s);
    const QDir folder(m_folder);
    for (int n = 1; n <= 1000; ++n) {
        const QString candidate =
            folder.filePath(n == 1 ? stem + u".xlsx"_s : u"%1 (%2).xlsx"_s.arg(stem).arg(n));
        if (!QFileInfo(candidate).exists() && !QFileInfo(candidate).isSymLink()) {
            m_active.reset(new Workbook(candidate));
            return *m_active;
        }
    }
    throw Failure(u"The folder %1 holds too many workbooks of this second"_s.arg(
        QDir::toNativeSeparators(m_folder)));
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
    book->m_file.save();
    const QString documentPath = book->m_file.path();

    try {
        m_shell.openDocument(documentPath);
    } catch (...) {
        QFile::remove(documentPath);
        throw;
    }
    m_documentPath = documentPath;
    m_visible = true;
}
