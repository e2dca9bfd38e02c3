#pragma once

// The forms in which the results window saves its list: the options of its
// "Output" frame.
enum class OutputChoice {
    TextFile,            // "Text File": a text file the user names in a save dialog
    SpreadsheetTwoCells, // "Excel (2 cells)": first and last name in columns A and B
    SpreadsheetOneCell,  // "Excel (1 cell)": the full name in column A
};
