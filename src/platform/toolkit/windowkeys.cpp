#include "windowkeys.h"

#include <QAbstractButton>
#include <QKeyEvent>

bool windowkeys::handle(QWidget* window, const QKeyEvent* event)
{
    if (event->matches(QKeySequence::Cancel)) {
        window->close();
        return true;
    }
    if (event->key() != Qt::Key_Return && event->key() != Qt::Key_Enter)
        return false;
    auto* button = qobject_cast<QAbstractButton*>(window->focusWidget());
    if (!button)
        return false;
    button->click();
    return true;
}
