#pragma once

#include "generate/generation.h"
#include "results/resultrows.h"

#include <QAbstractTableModel>
#include <QHash>
#include <QStringList>

// The results list: one row per generated full name, first name in the first
// column and last name in the second. A million rows cost 8 bytes each: a row
// holds two indices into the run's tidied names. The user may retype a first
// name in place; only the edited rows keep a text of their own.
class ResultsModel : public QAbstractTableModel, public ResultRows {
    Q_OBJECT

public:
    explicit ResultsModel(QObject* parent = nullptr);

    // Adds a column with its header; the list starts without columns.
    void addColumn(const QString& header);

    // Empties the list.
    void clear();
    // Replaces every row by a run's rows, in the order made.
    void setRows(GeneratedNames names);

    // ResultRows: what saving reads.
    int rowCount() const override { return int(m_names.rows.size()); }
    QString firstName(int row) const override;
    QString lastName(int row) const override;
    // Until a first name is retyped.
    std::optional<IndexedNames> indexedNames() const override;

    // The view's side. No default argument here: rowCount() alone is the
    // ResultRows count.
    int rowCount(const QModelIndex& parent) const override;
    int columnCount(const QModelIndex& parent = {}) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    bool setData(const QModelIndex& index, const QVariant& value, int role) override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;

private:
    QStringList m_headers;
    GeneratedNames m_names;
    QHash<int, QString> m_editedFirstNames;
};
