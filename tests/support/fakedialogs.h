#pragma once

#include "base/dialogs.h"

#include <QList>
#include <QQueue>

// A scripted stand-in for the real dialogs: records everything shown and
// answers from queues. An unanswered prompt or file dialog is a cancel.
class FakeDialogs : public Dialogs {
public:
    enum class Kind { Message, Input, Open, Save };

    struct Shown {
        Kind kind;
        QString title;
        QString text; // the message, the prompt; empty for file dialogs
        MessageIcon icon = MessageIcon::None;
        QString filter;
    };

    void messageBox(const QString& text, const QString& title, MessageIcon icon) override;
    QString inputBox(const QString& prompt, const QString& title) override;
    QStringList openFileNames(const QString& title, const QString& filter) override;
    QString saveFileName(const QString& title, const QString& filter) override;

    void answerInput(const QString& reply) { m_inputs.enqueue(reply); }
    void answerOpen(const QStringList& paths) { m_opens.enqueue(paths); }
    void answerSave(const QString& path) { m_saves.enqueue(path); }

    QList<Shown> shown;
    // The texts of the message boxes shown, in order.
    QStringList messages() const;
    void clear() { shown.clear(); }

private:
    QQueue<QString> m_inputs;
    QQueue<QStringList> m_opens;
    QQueue<QString> m_saves;
};
