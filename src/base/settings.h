#pragma once

#include <QSettings>
#include <QString>

#include <optional>

class Dialogs;

// The per-user settings store: string values under the organisation
// "Varnholt", section "Quillane", in an INI file in the user's configuration
// folder. Every write reaches the file at once, so a setting survives the
// program being killed a moment later.
//
// A store that is damaged or out of reach never stops the program: a
// malformed file reads as the keys it holds, and a write that cannot reach
// the file still takes effect for the rest of the run. The first such write
// is reported once; later ones keep trying, silently.
class Settings {
public:
    Settings();

    // Where the one report of a store that cannot be written is shown;
    // without it a failed write is only remembered.
    void reportWriteFailuresTo(Dialogs* dialogs) { m_dialogs = dialogs; }

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
    // Whether a write has failed to reach the file during this run.
    bool writeFailed() const { return m_writeFailed; }

private:
    bool sync();

    mutable QSettings m_store;
    Dialogs* m_dialogs = nullptr;
    bool m_writeFailed = false;
};

// The text as a Boolean, or nothing when it is neither True/False nor a number.
std::optional<bool> parseStoredBool(const QString& text);
