#include "names/namelists.h"

#include "names/database.h"

NameLists::NameLists(QString databasePath)
    : m_databasePath(std::move(databasePath))
{
}

void NameLists::RefreshLists(const ListChoice& choice)
{
    Connection connection(m_databasePath);
    if (choice.user) {
        m_firstPane.setNames(connection.queryNames(Sql::UserFirstNames));
        m_lastPane.setNames(connection.queryNames(Sql::UserLastNames));
    } else if (choice.builtIn) {
        m_lastPane.setNames(connection.queryNames(Sql::BuiltInLastNames));
        if (choice.both)
            m_firstPane.setNames(connection.queryNames(Sql::BuiltInFirstNamesBoth));
        else if (choice.male)
            m_firstPane.setNames(connection.queryNames(Sql::BuiltInFirstNamesMale));
        else if (choice.female)
            m_firstPane.setNames(connection.queryNames(Sql::BuiltInFirstNamesFemale));
    }
}
