#include "base/settings.h"

#include "base/failure.h"

#include <QLocale>

using namespace Qt::StringLiterals;

namespace {
const QString Section = u"Quillane/"_s;
}

Settings::Settings()
    : m_store(QSettings::IniFormat, QSettings::UserScope, u"Varnholt"_s)
{
}

QString Settings::read(const QString& key, const QString& defaultValue) const
{
    const QString path = Section + key;
    if (!m_store.contains(path))
        return defaultValue;
    return m_store.value(path).toString();
}

void Settings::write(const QString& key, const QString& value)
{
    m_store.setValue(Section + key, value);
    m_store.sync();
    if (m_store.status() != QSettings::NoError)
        throw Failure(u"The settings file %1 cannot be written"_s.arg(m_store.fileName()));
}

bool Settings::readBool(const QString& key, const QString& defaultValue) const
{
    if (const auto stored = parseStoredBool(read(key, defaultValue)))
        return *stored;
    return parseStoredBool(defaultValue).value_or(false);
}

void Settings::writeBool(const QString& key, bool value)
{
    write(key, value ? u"True"_s : u"False"_s);
}

std::optional<bool> parseStoredBool(const QString& text)
{
    const QString trimmed = text.trimmed();
    if (trimmed.compare(u"True"_s, Qt::CaseInsensitive) == 0)
        return true;
    if (trimmed.compare(u"False"_s, Qt::CaseInsensitive) == 0)
        return false;
    bool isNumber = false;
    double number = trimmed.toDouble(&isNumber);
    if (!isNumber)
        number = QLocale::system().toDouble(trimmed, &isNumber);
    if (!isNumber)
        return std::nullopt;
    return number != 0.0;
}
