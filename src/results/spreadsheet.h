#pragma once

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

// An .xlsx file with one sheet, written as it is filled and built under a
// hidden name of its own in its folder: it gets its real name only once it
// is complete, so a failure halfway leaves nothing that looks like a
// workbook of names. Destroyed before then, it leaves nothing behind.
class WorkbookFile {
public:
    explicit WorkbookFile(const QString& folder);
    ~WorkbookFile();
    WorkbookFile(const WorkbookFile&) = delete;
    WorkbookFile& operator=(const WorkbookFile&) = delete;

    Worksheet& sheet() { return m_sheet; }

    // Writes out the rest of the file, complete under its hidden name.
    void close();
    // Gives the closed file the name path. Without replace an existing file
    // of that name stays and the answer is false; with it, the file takes
    // the place of what was there in one step, keeping its permissions.
    bool moveTo(const QString& path, bool replace);

private:
    void discard();

    QString m_folder;
    QString m_partPath;
    lxw_workbook* m_book = nullptr;
    Worksheet m_sheet;
};

class Workbook {
public:
    Worksheet& ActiveSheet();

private:
    friend class SpreadsheetApplication;
    explicit Workbook(const QString& folder);

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
    // (made if missing). The file is named for the moment it is made, so
    // the user recognises it in the program's title bar:
    // "Quillane names 2026-12-06 21.30.05.xlsx".
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
