#include "support/fakedialogs.h"

void FakeDialogs::messageBox(const QString& text, const QString& title, MessageIcon icon)
{
    shown.append({Kind::Message, title, text, icon, {}});
}

QString FakeDialogs::inputBox(const QString& prompt, const QString& title)
{
    shown.append({Kind::Input, title, prompt, MessageIcon::None, {}});
    return m_inputs.isEmpty() ? QString() : m_inputs.dequeue();
}

QStringList FakeDialogs::openFileNames(const QString& title, const QString& filter)
{
    shown.append({Kind::Open, title, {}, MessageIcon::None, filter});
    return m_opens.isEmpty() ? QStringList() : m_opens.dequeue();
}

QString FakeDialogs::saveFileName(const QString& title, const QString& filter)
{
    shown.append({Kind::Save, title, {}, MessageIcon::None, filter});
    return m_saves.isEmpty() ? QString() : m_saves.dequeue();
}

QStringList FakeDialogs::messages() const
{
    QStringList texts;
    for (const Shown& s : shown) {
        if (s.kind == Kind::Message)
            texts.append(s.text);
    }
    return texts;
}
