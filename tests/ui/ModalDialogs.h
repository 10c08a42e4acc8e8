#pragma once

#include <QApplication>
#include <QPointer>
#include <QTimer>

#include <functional>

namespace CorvidTest {

// Runs `action` on the next modal dialog of class T to open; polls the event
// loop, so call it before the code that opens the dialog. Delete the answer
// when no dialog may have come.
template<typename T>
QPointer<QTimer> onNextModal(std::function<void(T *)> action)
{
    auto *timer = new QTimer;
    timer->setInterval(5);
    QObject::connect(timer, &QTimer::timeout, [timer, action] {
        T *dialog = qobject_cast<T *>(QApplication::activeModalWidget());
        if (!dialog || !dialog->isVisible())
            return;
        timer->stop();
        timer->deleteLater();
        action(dialog);
    });
    timer->start();
    return timer;
}

} // namespace CorvidTest
