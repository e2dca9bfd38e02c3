#pragma once

#include <QByteArray>
#include <QString>

#include <memory>

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
    friend class Workbook;
    friend class SpreadsheetCell;
    explicit Worksheet(lxw_worksheet* sheet);

    lxw_worksheet* m_sheet;
    // One buffer for the UTF-8 of every cell: a million rows make two
    // million cells, and an array made and freed for each is time.
    QByteArray m_utf8;
};

class Workbook {
public:
    Worksheet& ActiveSheet();

private:
    friend class SpreadsheetApplication;
    Workbook(lxw_workbook* book, lxw_worksheet* sheet);

    lxw_workbook* m_book;
    Worksheet m_sheet;
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
    void discardWorkbook();

    Shell& m_shell;
    QString m_folder;
    WorkbookCollection m_workbooks;
    std::unique_ptr<Workbook> m_active;
    QString m_partPath;
    QString m_documentPath;
    bool m_visible = false;
};
