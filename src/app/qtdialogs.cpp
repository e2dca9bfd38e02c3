#include "app/qtdialogs.h"

#include "base/failure.h"

#include <QApplication>
#include <QFileDialog>
#include <QInputDialog>
#include <QMessageBox>

using namespace Qt::StringLiterals;

namespace {

QWidget* dialogParent()
{
    return QApplication::activeWindow();
}

// Message texts break lines with CR, LF or CR LF; a label breaks at LF only.
// Any other control character a message quotes from a file is shown escaped.
QString withLineFeeds(QString text)
{
    text.replace(u"\r\n"_s, u"\n"_s);
    text.replace(u'\r', u'\n');
    return escapeControlCharacters(text);
}

} // namespace

void QtDialogs::messageBox(const QString& text, const QString& title, MessageIcon icon)
{
    QMessageBox box(dialogParent());
    box.setWindowTitle(title);
    box.setTextFormat(Qt::PlainText);
    box.setText(withLineFeeds(text));
    box.setStandardButtons(QMessageBox::Ok);
    switch (icon) {
    case MessageIcon::None:
        box.setIcon(QMessageBox::NoIcon);
        break;
    case MessageIcon::Exclamation:
        box.setIcon(QMessageBox::Warning);
        break;
    case MessageIcon::Critical:
        box.setIcon(QMessageBox::Critical);
        break;
    }
    box.exec();
}

QString QtDialogs::inputBox(const QString& prompt, const QString& title)
{
    bool ok = false;
    const QString reply =
        QInputDialog::getText(dialogParent(), title, prompt, QLineEdit::Normal, QString(), &ok);
    return ok ? reply : QString();
}

QStringList QtDialogs::openFileNames(const QString& title, const QString& filter)
{
    return QFileDialog::getOpenFileNames(dialogParent(), title, QString(), filter);
}

QString QtDialogs::saveFileName(const QString& title, const QString& filter)
{
    return QFileDialog::getSaveFileName(dialogParent(), title, QString(), filter, nullptr,
                                        QFileDialog::DontConfirmOverwrite);
}
