/*
 * Quillane skin: a Qt style sheet for the main window.
 *
 * The window, its frames and its options keep the button-face background
 * they are given when the skin is found; the skin draws the controls on it.
 * Every control sits at a fixed place, so nothing here may grow a control's
 * content: paddings stay small enough for the captions to fit.
 */

QWidget#Form1 {
    color: #1d2b3a;
}

/* Frames: a rounded outline, the title set into its top edge. */
QGroupBox {
    border: 1px solid #b4c1cf;
    border-radius: 6px;
    margin-top: 7px;
    color: #1f4a78;
}
QGroupBox::title {
    subcontrol-origin: margin;
    subcontrol-position: top left;
    left: 8px;
    padding: 0px 3px;
    background-color: palette(window);
}
QGroupBox:disabled {
    color: #8a96a3;
}

/* Push buttons: a blue face that lights up under the pointer. */
QPushButton {
    color: #ffffff;
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #4c8fd6, stop: 1 #2d69ab);
    border: 1px solid #245689;
    border-radius: 5px;
    padding: 0px 6px;
}
QPushButton:hover {
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #62a2e6, stop: 1 #3679c0);
}
QPushButton:pressed {
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #23588f, stop: 1 #2f6cad);
}
QPushButton:focus {
    border: 1px solid #0f2e4f;
}
QPushButton:disabled {
    color: #eef2f6;
    background-color: #a8b6c5;
    border: 1px solid #98a7b7;
}

/* Option buttons: round marks in the buttons' blue. */
QRadioButton {
    spacing: 5px;
}
QRadioButton:disabled {
    color: #8a96a3;
}
QRadioButton::indicator {
    width: 12px;
    height: 12px;
    border: 1px solid #7f95ad;
    border-radius: 7px;
    background-color: #ffffff;
}
QRadioButton::indicator:hover {
    border-color: #2d69ab;
}
QRadioButton::indicator:checked {
    border-color: #2d69ab;
    background-color: qradialgradient(cx: 0.5, cy: 0.5, radius: 0.5, fx: 0.5, fy: 0.5,
                                      stop: 0 #2d69ab, stop: 0.5 #2d69ab,
                                      stop: 0.62 #ffffff, stop: 1 #ffffff);
}
QRadioButton::indicator:disabled {
    border-color: #b8c2cc;
    background-color: #eef1f4;
}
QRadioButton::indicator:checked:disabled {
    background-color: qradialgradient(cx: 0.5, cy: 0.5, radius: 0.5, fx: 0.5, fy: 0.5,
                                      stop: 0 #9fadbb, stop: 0.5 #9fadbb,
                                      stop: 0.62 #eef1f4, stop: 1 #eef1f4);
}

/* The count box. */
QLineEdit {
    background-color: #ffffff;
    border: 1px solid #9fb0c3;
    border-radius: 3px;
    padding: 0px 4px;
    selection-background-color: #2d69ab;
    selection-color: #ffffff;
}
QLineEdit:focus {
    border: 1px solid #2d69ab;
}

/* The list panes and their column header. */
QTableView {
    qproperty-alternatingRowColors: true;
    background-color: #ffffff;
    alternate-background-color: #f2f6fb;
    border: 1px solid #9fb0c3;
    border-radius: 3px;
    selection-background-color: #2d69ab;
    selection-color: #ffffff;
}
QTableView:focus {
    border: 1px solid #2d69ab;
}
QHeaderView {
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #fbfcfe, stop: 1 #dfe7f1);
    border: none;
}
QHeaderView::section {
    color: #1f4a78;
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #fbfcfe, stop: 1 #dfe7f1);
    border: none;
    border-bottom: 1px solid #9fb0c3;
    border-right: 1px solid #c7d2de;
    padding: 1px 6px;
    font-weight: bold;
}

/* Slim scroll bars for the panes. */
QScrollBar:vertical {
    background: #eef2f7;
    width: 12px;
    margin: 0px;
    border: none;
}
QScrollBar:horizontal {
    background: #eef2f7;
    height: 12px;
    margin: 0px;
    border: none;
}
QScrollBar::handle:vertical {
    background: #b3c2d3;
    min-height: 24px;
    margin: 2px;
    border-radius: 4px;
}
QScrollBar::handle:horizontal {
    background: #b3c2d3;
    min-width: 24px;
    margin: 2px;
    border-radius: 4px;
}
QScrollBar::handle:hover {
    background: #8aa2bd;
}
QScrollBar::add-line, QScrollBar::sub-line {
    width: 0px;
    height: 0px;
    border: none;
    background: none;
}
QScrollBar::add-page, QScrollBar::sub-page {
    background: none;
}

/* The progress bar. */
QProgressBar {
    background-color: #ffffff;
    border: 1px solid #9fb0c3;
    border-radius: 4px;
}
QProgressBar::chunk {
    background-color: qlineargradient(x1: 0, y1: 0, x2: 0, y2: 1,
                                      stop: 0 #63a6e8, stop: 1 #2d69ab);
    border-radius: 3px;
    margin: 1px;
}
