#pragma once

#include <QSettings>
#include <QString>

#include <optional>

// The per-user settings store: string values under the organisation
// "Varnholt", section "Quillane", in an INI file in the user's configuration
// folder. Every write reaches the file at once, so a setting survives the
// program being killed a moment later.
class Settings {
public:
    Settings();

    // The stored text, or defaultValue when the key is absent. A key stored
    // with an empty value reads as empty.
    QString read(const QString& key, const QString& defaultValue) const;
    void write(const QString& key, const QString& value);

    // Booleans are written as "True" or "False". Reading accepts those (in any
    // case) and numbers, zero meaning false. A value that is neither reads as
    // the default, which must itself be readable.
    bool readBool(const QString& key, const QString& defaultValue) const;
    void writeBool(const QString& key, bool value);

    // Where the store lives, for the user's and the tests' information.
    QString fileName() const { return m_store.fileName(); }

private:
    mutable QSettings m_store;
};

// The text as a Boolean, or nothing when it is neither True/False nor a number.
std::optional<bool> parseStoredBool(const QString& text);
