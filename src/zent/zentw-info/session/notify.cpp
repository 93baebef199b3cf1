// SPDX-License-Identifier: Apache-2.0
#include "session/notify.h"

#include "devices/removedevice.h"

#include <QDebug>
#include <QThread>

struct Notification::Private {
    Notification* q;
};

Notification::Notification(QObject* parent) : QObject(parent), d(new Private{this})
{
}

Notification::~Notification() = default;

void Notification::Notify(int type, const QString& username, const QString& title, const QString& message,
                          const QString& sender)
{
    emit onMessage(type, username, title, message, sender);
}

void Notification::AgencyNotify(const QString&, const QString&) const
{
}

void Notification::GioMount(const QString& manufacturer, const QString& product, const QString& serial,
                            const QString& uid)
{
    qDebug() << "GioMount manufacturer:" << manufacturer << ":product:" << product << ":serial:" << serial
             << ":uid:" << uid;
    RemoveDevice device(nullptr);
    device.removeDevice(manufacturer, product, serial, uid);
    // Part of the agreed call sequence, and harmless: the work is done, and a thread never started runs nothing.
    QThread thread;
    device.moveToThread(&thread);
}
