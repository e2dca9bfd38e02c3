#include "results/resultsmodel.h"

ResultsModel::ResultsModel(QObject* parent)
    : QAbstractTableModel(parent)
{
}

void ResultsModel::addColumn(const QString& header)
{
    const int column = int(m_headers.size());
    beginInsertColumns({}, column, column);
    m_headers.append(header);
    endInsertColumns();
}

void ResultsModel::clear()
{
    setRows({});
}

void ResultsModel::setRows(GeneratedNames names)
{
    beginResetModel();
    // The old run's memory goes before the new one is in place.
    m_names = {};
    m_editedFirstNames.clear();
    m_names = std::move(names);
    endResetModel();
}

QString ResultsModel::firstName(int row) const
{
    if (row < 0 || row >= rowCount())
        return {};
    if (!m_editedFirstNames.isEmpty()) {
        const auto edited = m_editedFirstNames.constFind(row);
        if (edited != m_editedFirstNames.cend())
            return *edited;
    }
    return m_names.firstNames.at(m_names.rows[std::size_t(row)].first);
}

QString ResultsModel::lastName(int row) const
{
    if (row < 0 || row >= rowCount())
        return {};
    return m_names.lastNames.at(m_names.rows[std::size_t(row)].last);
}

std::optional<IndexedNames> ResultsModel::indexedNames() const
{
    if (!m_editedFirstNames.isEmpty())
        return std::nullopt;
    return IndexedNames{m_names.firstNames, m_names.lastNames, m_names.rows};
}

int ResultsModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : rowCount();
}

int ResultsModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : int(m_headers.size());
}

QVariant ResultsModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || (role != Qt::DisplayRole && role != Qt::EditRole))
        return {};
    switch (index.column()) {
    case 0:
        return firstName(index.row());
    case 1:
        return lastName(index.row());
    default:
        return {};
    }
}

bool ResultsModel::setData(const QModelIndex& index, const QVariant& value, int role)
{
    if (!index.isValid() || index.column() != 0 || role != Qt::EditRole
        || index.row() >= rowCount())
        return false;
    const QString text = value.toString();
    if (text == firstName(index.row()))
        return true;
    m_editedFirstNames.insert(index.row(), text);
    Q_EMIT dataChanged(index, index, {Qt::DisplayRole, Qt::EditRole});
    return true;
}

Qt::ItemFlags ResultsModel::flags(const QModelIndex& index) const
{
    if (!index.isValid())
        return Qt::NoItemFlags;
    Qt::ItemFlags flags = Qt::ItemIsEnabled | Qt::ItemIsSelectable | Qt::ItemNeverHasChildren;
    if (index.column() == 0)
        flags |= Qt::ItemIsEditable;
    return flags;
}

QVariant ResultsModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation == Qt::Horizontal && role == Qt::DisplayRole && section >= 0
        && section < m_headers.size())
        return m_headers.at(section);
    return {};
}
