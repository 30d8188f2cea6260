#pragma once
// Types text into a widget key by key as the user would, umlauts included (QTest's key clicks
// take ASCII only): each character is a key press and release carrying that text.

#include <QApplication>
#include <QKeyEvent>
#include <QString>
#include <QWidget>

namespace orvanta::test {

inline void typeKeys(QWidget* w, const QString& text)
{
    for (const QChar c : text) {
        QKeyEvent press(QEvent::KeyPress, 0, Qt::NoModifier, QString(c));
        QApplication::sendEvent(w, &press);
        QKeyEvent release(QEvent::KeyRelease, 0, Qt::NoModifier, QString(c));
        QApplication::sendEvent(w, &release);
    }
}

} // namespace orvanta::test
