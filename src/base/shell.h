#pragma once

#include <QString>
#include <QUrl>

// Starting other programs without waiting for them.
class Shell {
public:
    virtual ~Shell() = default;

    // Opens a web page in the user's browser.
    virtual void openWebPage(const QUrl& url) = 0;

    // Opens a document in the desktop's program for its type. Throws Failure
    // when the desktop has no program for it.
    virtual void openDocument(const QString& path) = 0;
};

// The desktop's own means: xdg-open and its file-type associations.
class DesktopShell : public Shell {
public:
    void openWebPage(const QUrl& url) override;
    void openDocument(const QString& path) override;
};
