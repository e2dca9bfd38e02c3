#include "names/panemodel.h"

PaneModel::PaneModel(QObject* parent)
    : QAbstractListModel(parent)
{
}

void PaneModel::setHeader(const QString& header)
{
    m_header = header;
    Q_EMIT headerDataChanged(Qt::Horizontal, 0, 0);
}

void PaneModel::setNames(QStringList names)
{
    beginResetModel();
    m_names = std::move(names);
    endResetModel();
}

void PaneModel::removeName(int row)
{
    if (row < 0 || row >= count())
        return;
    beginRemoveRows({}, row, row);
    m_names.removeAt(row);
    endRemoveRows();
}

int PaneModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : count();
}

QVariant PaneModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || index.row() >= count())
        return {};
    if (role == Qt::DisplayRole)
        return m_names.at(index.row());
    return {};
}

QVariant PaneModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (section == 0 && orientation == Qt::Horizontal && role == Qt::DisplayRole)
        return m_header;
    return {};
}
