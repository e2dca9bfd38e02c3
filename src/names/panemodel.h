#pragma once

#include <QAbstractListModel>
#include <QStringList>

// One list pane's names, in the order the database returned them, for a view
// that shows a single column under a header. Holds a million names without
// an item object per name.
class PaneModel : public QAbstractListModel {
    Q_OBJECT

public:
    explicit PaneModel(QObject* parent = nullptr);

    void setHeader(const QString& header);
    void setNames(QStringList names);
    // Takes one name out of the pane (not out of the database). An invalid
    // row is ignored.
    void removeName(int row);

    const QStringList& names() const { return m_names; }
    int count() const { return int(m_names.size()); }

    int rowCount(const QModelIndex& parent = {}) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;

private:
    QStringList m_names;
    QString m_header;
};
