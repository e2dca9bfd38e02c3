#pragma once

#include "base/safefile.h"
#include "results/outputchoice.h"

#include <QByteArray>
#include <QString>

#include <memory>

class ResultRows;
class Shell;
struct lxw_workbook;
struct lxw_worksheet;

// The spreadsheet that saving hands to the user, shaped like a spreadsheet
// program driven from outside: an application, its collection of
// workbooks, the active workbook and its active sheet, cells addressed by
// (row, column) from 1, and making the application visible.
//
// The workbook is written as an .xlsx file as it is filled (rows must come
// in order, each row once). Making the application visible finishes the
// file under a new name in the given folder and opens it in the desktop's
// program for spreadsheets, without waiting; the user saves it from there.
// Every failure throws Failure; nothing half-written stays behind.
class SpreadsheetApplication;
class Worksheet;

class SpreadsheetCell {
public:
    // Stores the text as a text cell: a value such as 0012, TRUE or =SUM(A1)
    // stays that text, never a number, a truth value or a formula.
    SpreadsheetCell& operator=(const QString& text);

private:
    friend class Worksheet;
    SpreadsheetCell(Worksheet& sheet, int row, int column);

    Worksheet& m_sheet;
    int m_row;
    int m_column;
};

class Worksheet {
public:
    SpreadsheetCell cells(int row, int column);

private:
    friend class WorkbookFile;
    friend class SpreadsheetCell;
    explicit Worksheet(lxw_worksheet* sheet);

    lxw_worksheet* m_sheet;
    // One buffer for the UTF-8 of every cell: a million rows make two
    // million cells, and an array made and freed for each is time.
    QByteArray m_utf8;
};

// Writes the results list into a sheet from its first row on: the first
// and last name in columns A and B, or the full name in column A.
void fillSheet(Worksheet& sheet, OutputChoice layout, const ResultRows& rows);

// An .xlsx file with one sheet, written as it is filled and given its
// place only once it is complete (see SafeFile): a failure halfway leaves
// what the path named as it was. Destroyed before save(), it leaves nothing
// behind. libxlsxwriter's own messages on standard error are kept back: the
// failure it causes is the one message.
class WorkbookFile {
public:
    explicit WorkbookFile(std::unique_ptr<SafeFile> file);
    ~WorkbookFile();
    WorkbookFile(const WorkbookFile&) = delete;
    WorkbookFile& operator=(const WorkbookFile&) = delete;

    Worksheet& sheet() { return m_sheet; }

    // Writes out the rest of the workbook and gives it its place.
    void save();
    // Where it goes, as given.
    const QString& path() const;

private:
    void discard();

    // libxlsxwriter writes files of its own all along.
    WriteSignalsHeld m_signals;
    std::unique_ptr<SafeFile> m_file;
    // Where libxlsxwriter writes: the safe file's temporary file, or, for a
    // device or a FIFO that is written directly, a file of its own in the
    // temporary folder, copied there once complete.
    std::unique_ptr<SafeFile> m_staging;
    lxw_workbook* m_book = nullptr;
    Worksheet m_sheet;
};

// Saves the results list as a workbook at path, replacing what it names,
// with the layout of fillSheet; never over the names database (namesDatabase;
// empty for none). Throws Failure.
void saveWorkbook(const ResultRows& rows, OutputChoice layout, const QString& path,
                  const QString& namesDatabase);

class Workbook {
public:
    Worksheet& ActiveSheet();

private:
    friend class SpreadsheetApplication;
    explicit Workbook(const QString& path);

    WorkbookFile m_file;
};

class WorkbookCollection {
public:
    // Adds a new, empty workbook with one sheet; it becomes the active one.
    // The application holds one workbook: a second Add is refused.
    Workbook& Add();

private:
    friend class SpreadsheetApplication;
    explicit WorkbookCollection(SpreadsheetApplication& application);

    SpreadsheetApplication& m_application;
};

class SpreadsheetApplication {
public:
    // folder: where the finished workbook is put for the desktop's program
    // (made if missing). The file is named for the moment it is added, so
    // the user recognises it in the program's title bar:
    // "Quillane names 2026-12-06 21.30.05.xlsx"; it never replaces a file.
    SpreadsheetApplication(Shell& shell, QString folder);
    // An application that was never made visible takes its workbook with
    // it: the unfinished file is removed.
    ~SpreadsheetApplication();

    SpreadsheetApplication(const SpreadsheetApplication&) = delete;
    SpreadsheetApplication& operator=(const SpreadsheetApplication&) = delete;

    WorkbookCollection& Workbooks() { return m_workbooks; }
    Workbook& ActiveWorkbook();

    // Visible true finishes the workbook and opens it. If the desktop has no
    // program for it, the finished file is removed again: nobody could see
    // it, and it is not the user's to keep.
    void setVisible(bool visible);
    bool isVisible() const { return m_visible; }

    // The finished file once visible; empty before.
    QString documentPath() const { return m_documentPath; }

private:
    friend class WorkbookCollection;
    Workbook& addWorkbook();

    Shell& m_shell;
    QString m_folder;
    WorkbookCollection m_workbooks;
    std::unique_ptr<Workbook> m_active;
    QString m_documentPath;
    bool m_visible = false;
};
