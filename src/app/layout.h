#pragma once

// Building blocks of the windows' fixed layouts: every control carries its
// designer name as object name and its place in pixels. A screen reader
// speaks a button's caption as it stands: Qt takes the spoken name from it,
// so it follows every change of the caption.

#include "app/twips.h"

#include <QAbstractItemModel>
#include <QGroupBox>
#include <QHeaderView>
#include <QPushButton>
#include <QRadioButton>
#include <QTableView>

namespace Layout {

// The windows, frames and option buttons start white; a skin or the
// loading of the results window turns them to the button face.
inline void paintWhite(QWidget* widget)
{
    QPalette palette = widget->palette();
    palette.setColor(QPalette::Window, Qt::white);
    widget->setPalette(palette);
    // Buttons fill with the button colour unless told otherwise.
    widget->setBackgroundRole(QPalette::Window);
    widget->setAutoFillBackground(true);
}

template <typename Control>
Control* place(QWidget* container, const QString& name, QRect geometry)
{
    auto* control = new Control(container);
    control->setObjectName(name);
    control->setGeometry(geometry);
    return control;
}

inline QPushButton* pushButton(QWidget* container, const QString& name, const QString& caption,
                               QRect geometry)
{
    auto* button = place<QPushButton>(container, name, geometry);
    button->setText(caption);
    button->setFont(arialBold(11.25));
    return button;
}

inline QGroupBox* frame(QWidget* container, const QString& name, const QString& caption,
                        QRect geometry)
{
    auto* frame = place<QGroupBox>(container, name, geometry);
    frame->setTitle(caption);
    // Set once, as a title never changes: without it Qt would speak the
    // enclosing frame's title for a nested frame.
    frame->setAccessibleName(caption);
    paintWhite(frame);
    return frame;
}

inline QRadioButton* optionButton(QWidget* container, const QString& name, const QString& caption,
                                  QRect geometry)
{
    auto* option = place<QRadioButton>(container, name, geometry);
    option->setText(caption);
    paintWhite(option);
    return option;
}

// A list in report form: column headers, whole-row selection, no grid. A
// table view keeps 8 bytes a row where a tree view keeps 40, which matters
// at a million rows.
inline QTableView* reportView(QWidget* container, const QString& name, const QString& spokenName,
                              QRect geometry, QAbstractItemModel* model)
{
    auto* view = place<QTableView>(container, name, geometry);
    view->setModel(model);
    view->setAccessibleName(spokenName);
    view->setShowGrid(false);
    view->setWordWrap(false);
    view->setCornerButtonEnabled(false);
    view->setSortingEnabled(false);
    view->setSelectionMode(QAbstractItemView::SingleSelection);
    view->setSelectionBehavior(QAbstractItemView::SelectRows);
    view->setEditTriggers(QAbstractItemView::NoEditTriggers);
    QHeaderView* rows = view->verticalHeader();
    rows->hide();
    rows->setSectionResizeMode(QHeaderView::Fixed);
    rows->setDefaultSectionSize(view->fontMetrics().height() + 2);
    QHeaderView* columns = view->horizontalHeader();
    columns->setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
    columns->setHighlightSections(false);
    columns->setStretchLastSection(false);
    columns->setSectionsMovable(false);
    columns->setSectionsClickable(false);
    return view;
}

} // namespace Layout
