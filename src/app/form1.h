#pragma once

// The main window.
//
// Form1 shows the two list panes (first names in ListView2, last names in
// ListView1), the choice of source list and gender, the count box and the
// buttons. It only wires its controls to handlers; each handler hands its
// work to a plain class that tests drive directly:
//
//   option clicks, Delete key, double-click --> NameLists (names/)   --> names.mdb
//   add, delete/clear, load from file       --> ListEditor --> list operations (names/) --> names.mdb
//   "Start Generating"                        --> generation (generate/) --> Form2
//   every button handler                      --> Trap --> error report on failure
//
// The panes are the hub: NameLists::RefreshLists rebuilds them from the
// database after every option click, add, delete and import, and generation
// draws from what they hold. Every setting is written the moment it changes.

#include "app/environment.h"
#include "base/pointer.h"
#include "names/listchoice.h"
#include "app/listeditor.h"
#include "names/namelists.h"

#include <QWidget>

#include <memory>

class Form2;
class QButtonGroup;
class QGroupBox;
class QLineEdit;
class QProgressBar;
class QPushButton;
class QRadioButton;
class QTableView;
class Splash;
class WindowPointer;

class Form1 : public QWidget {
    Q_OBJECT

public:
    explicit Form1(Environment& environment, QWidget* parent = nullptr);
    ~Form1() override;

    // The start-up sequence. Throws Failure; nothing traps it, and the
    // program then ends without showing the window.
    void Form_Load();

    ListChoice listChoice() const;
    NameLists& lists() { return m_lists; }
    PointerOwner& pointer();
    // The results window, once generation has created it; null before.
    Form2* resultsWindow() const { return m_form2.get(); }

protected:
    void closeEvent(QCloseEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void buildLayout();
    void wireHandlers();
    void restoreOption(QRadioButton* option, bool selected);

    void Text1_Change();
    void Text1_GotFocus();
    void Option1_Click();
    void Option2_Click();
    void Option3_Click();
    void Option8_Click();
    void Option9_Click();
    void sourceOptionClick(bool gendersEnabled);
    // RefreshLists under the hourglass.
    void refreshLists(const ListChoice& choice);
    void ListView_Remove(QTableView* pane, PaneModel& model);
    void PushButton1_Click();
    void PushButton2_Click();
    void PushButton3_Click();
    void PushButton4_Click();
    void PushButton5_Click();
    void PushButton6_Click();
    void PushButton7_Click();
    void PushButton8_Click();
    Form2& form2();

    Environment& m_env;
    // Hidden after its pause, never destroyed before the main window.
    std::unique_ptr<Splash> m_splash;
    WindowPointer* m_pointer;
    QButtonGroup* m_sourceGroup;
    QButtonGroup* m_genderGroup;
    NameLists m_lists;
    std::unique_ptr<Form2> m_form2;
    ListEditor m_editor;

    QPushButton* PushButton1;
    QPushButton* PushButton2;
    QPushButton* PushButton3;
    QPushButton* PushButton4;
    QPushButton* PushButton5;
    QPushButton* PushButton6;
    QPushButton* PushButton7;
    QPushButton* PushButton8;
    QGroupBox* Frame1;
    QGroupBox* Frame3;
    QGroupBox* Frame4;
    QGroupBox* Frame5;
    QGroupBox* Frame6;
    QRadioButton* Option1;
    QRadioButton* Option2;
    QRadioButton* Option3;
    QRadioButton* Option8;
    QRadioButton* Option9;
    QLineEdit* Text1;
    QTableView* ListView1;
    QTableView* ListView2;
    QProgressBar* ProgressBar1;
};
