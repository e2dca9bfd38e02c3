#pragma once

#include <QAbstractItemView>
#include <QStringList>
#include <QWidget>

// A window's control by its object name; a missing one ends the test run.
template <typename T>
T* control(QWidget& window, const QString& name)
{
    auto* c = window.findChild<T*>(name);
    if (!c)
        qFatal("no control %s", qPrintable(name));
    return c;
}

// The texts a list view shows in one column, top to bottom.
inline QStringList shownColumn(QWidget& window, const QString& view, int column = 0)
{
    const QAbstractItemModel* model = control<QAbstractItemView>(window, view)->model();
    QStringList texts;
    for (int row = 0; row < model->rowCount(); ++row)
        texts.append(model->index(row, column).data().toString());
    return texts;
}

