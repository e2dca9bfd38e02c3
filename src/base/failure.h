#pragma once

#include <QByteArray>
#include <QString>

#include <exception>

// A failure that reaches the user. Its description is the text that the
// failing component gave (the database engine's message, the file system's
// error, ...) and is what the error report or the closing notice shows.
class Failure : public std::exception {
public:
    explicit Failure(QString description);

    const QString& description() const noexcept { return m_description; }
    const char* what() const noexcept override { return m_utf8.constData(); }

private:
    QString m_description;
    QByteArray m_utf8;
};

// The text with every control character but the line feed shown as an
// escape (\t, \r, \x1b, \u009b ...), for every message that may carry
// what a file or a command line held: a terminal or a dialog then shows
// the characters instead of obeying them.
QString escapeControlCharacters(const QString& text);

// The description of whatever is being thrown right now; call it only from a
// catch block. Failures give their own text, other exceptions a plain one.
QString describeCurrentException();
