#pragma once

// The results window.
//
// Form2 shows the rows of the last run of generation and the choice of how to
// save them. Generation creates it on first use and then only shows it; "< Back"
// only hides it, so the rows and the output choice last until the program
// ends. Closing it ends the program.

#include "app/environment.h"
#include "base/pointer.h"
#include "results/resultsmodel.h"

#include <QWidget>

class QGroupBox;
class QPushButton;
class QRadioButton;
class QTableView;
class WindowPointer;

class Form2 : public QWidget {
    Q_OBJECT

public:
    // mainWindow is shown again by "< Back".
    Form2(Environment& environment, QWidget& mainWindow);
    ~Form2() override;

    // The loading steps: the list's columns, the custom cursor, the colours.
    void Form_Load();

    ResultsModel& results() { return m_results; }
    PointerOwner& pointer();

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void buildLayout();

    void PushButton8_Click();
    // "Start Saving Results": wired to the saver.
    void PushButton2_Click();

    Environment& m_env;
    QWidget& m_mainWindow;
    WindowPointer* m_pointer;
    ResultsModel m_results;

    QTableView* ListView1;
    QGroupBox* Frame2;
    QRadioButton* Option4;
    QRadioButton* Option5;
    QRadioButton* Option6;
    QPushButton* PushButton2;
    QPushButton* PushButton8;
};
