#pragma once

#include <QByteArray>
#include <QByteArrayView>
#include <QString>
#include <QStringDecoder>

#include <optional>
#include <vector>

// The names of a text file, one per line, from its bytes handed over in
// pieces of any size; memory stays bounded however long a line is.
//
// - The text is read in UTF-8, or in UTF-16 or UTF-32 when the file starts
//   with their byte-order mark. A file without one whose first TextProbe
//   bytes are not valid UTF-8 is read as Windows-1252, the code page that
//   such lists are saved in on Windows. A leading byte-order mark is never
//   part of the first name; bytes that are not valid text later in a UTF-8
//   file become U+FFFD.
// - A file whose first TextProbe bytes hold a control character other than
//   tab, CR and LF (a NUL, an escape, ...) is not text: isText() says so.
// - A line ends at CR, LF or CR LF; every CR and every LF separates names.
// - Apostrophes and NUL characters are removed.
// - What is left is the name exactly as written, spaces included; an empty
//   piece is no name.
// - A name longer than MaxNameLength keeps only its first MaxNameLength
//   characters in text, and length tells how long it really was.
class NameSplitter {
public:
    // The longest name a list stores, in UTF-16 code units.
    static constexpr qsizetype MaxNameLength = 255;
    // How much of the start of a file tells its encoding and whether it is text.
    static constexpr qsizetype TextProbe = 64 * 1024;

    struct Name {
        QString text;
        qsizetype length = 0;
        bool overlong() const { return length > MaxNameLength; }
        friend bool operator==(const Name&, const Name&) = default;
    };

    // Decodes the next bytes and appends every name they complete.
    void feed(QByteArrayView bytes, std::vector<Name>& names);
    // The end of the input: appends the last name when no line end follows it.
    void finish(std::vector<Name>& names);

    // The whole of a text at once.
    static std::vector<Name> split(QByteArrayView bytes);

    // False once the start of the input has shown that it is not text.
    bool isText() const { return m_text; }

private:
    // Chooses the encoding from the first bytes, then splits them.
    void start(std::vector<Name>& names);
    void chooseEncoding();
    void decode(QByteArrayView bytes, std::vector<Name>& names);
    void scan(QStringView text, std::vector<Name>& names);
    void endName(std::vector<Name>& names);

    QByteArray m_head; // the first bytes, until they tell the encoding
    std::optional<QStringDecoder> m_decoder;
    bool m_utf8 = true;
    bool m_windows1252 = false;
    bool m_probing = false; // scanning the first TextProbe bytes
    bool m_text = true;
    QByteArray m_partial; // a UTF-8 character cut off at the end of the last bytes
    bool m_atStart = true;
    QString m_current;
    qsizetype m_length = 0;
};
