#pragma once

// The splash window: a borderless window, without a task-bar button, that
// greets the user at start with the first picture of the Splash folder beside
// the executable, under it a white strip with the check box "Hide this at
// next startup". It stays for a fixed pause and is then hidden, never
// destroyed. Ticking the box keeps it away at later starts.

#include "app/environment.h"

#include <QString>
#include <QWidget>

class QCheckBox;
class QLabel;
class Settings;

class Splash : public QWidget {
    Q_OBJECT

public:
    explicit Splash(Environment& environment, QWidget* parent = nullptr);

    // Shows the splash when the user wants it and a picture is there, waits,
    // and hides it again; returns when all of that is over. Without a
    // picture, or with the splash turned off, it returns at once.
    void SplashShow();

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void Pause(double seconds);
    void Check1_Click();

    Environment& m_env;
    QLabel* Image1;
    QCheckBox* Check1;
    QWidget* Line1;
    QWidget* Line2;
    QWidget* Line3;
    QWidget* Line4;
};

// Whether the splash is wanted: the stored "ShowAgain" is the number 0 (the
// key says the opposite of what it means: 1 keeps the splash away). Text
// that is not a number, which only an outside edit can leave there, keeps
// it away too.
bool splashWanted(const Settings& settings);

// The first file of the Splash folder in the file system's own listing
// order (folders, hidden and system files take no part), or empty when the
// folder is missing or holds no such file.
QString splashPicturePath(const QString& programFolder);
