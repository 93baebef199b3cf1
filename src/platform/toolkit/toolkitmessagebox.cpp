#include "toolkitmessagebox.h"

#include "themehelper.h"

#include <QGuiApplication>
#include <QLabel>
#include <QPainter>
#include <QPushButton>

namespace
{

constexpr int signSize = 32;

/// The sign of a box, drawn for the screen's scale: those of the style are bitmaps.
QPixmap sign(QMessageBox::Icon icon)
{
    const qreal ratio = qGuiApp->devicePixelRatio();
    QPixmap pixmap(QSize(signSize, signSize) * ratio);
    pixmap.setDevicePixelRatio(ratio);
    pixmap.fill(Qt::transparent);
    QPainter painter(&pixmap);
    painter.setRenderHint(QPainter::Antialiasing);
    const bool critical = icon == QMessageBox::Critical;
    const QColor face = critical ? QColor(0xc6, 0x28, 0x28) : QColor(0xf5, 0xb4, 0x00);
    painter.setBrush(face);
    painter.setPen(QPen(face, 4, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
    if (critical)
        painter.drawEllipse(QPointF(16, 16), 13, 13);
    else
        painter.drawPolygon(QPolygonF({QPointF(16, 5), QPointF(29, 27), QPointF(3, 27)}));
    painter.setPen(QPen(critical ? Qt::white : Qt::black, 3, Qt::SolidLine, Qt::RoundCap));
    if (critical) {
        painter.drawLine(QPointF(11, 11), QPointF(21, 21));
        painter.drawLine(QPointF(11, 21), QPointF(21, 11));
    } else {
        painter.drawLine(QPointF(16, 12), QPointF(16, 18));
        painter.drawPoint(QPointF(16, 24));
    }
    return pixmap;
}

} // namespace

ToolkitMessageBox::ToolkitMessageBox(Icon icon, const QString& title, const QString& text, QWidget* parent)
    : QMessageBox(icon, title, text, QMessageBox::Ok, parent)
{
    setTextFormat(Qt::PlainText);
    // The client's texts are Chinese whether Qt's translations are installed or not.
    button(QMessageBox::Ok)->setText(QStringLiteral("确定"));
    button(QMessageBox::Ok)->setIcon(QIcon());
    // Set on the label, since setIconPixmap() would make the box forget which kind it is.
    if (auto* label = findChild<QLabel*>(QStringLiteral("qt_msgboxex_icon_label")))
        label->setPixmap(sign(icon));
    const auto follow = [this] { setPalette(ThemeHelper::palette(ThemeHelper::instance()->themeType())); };
    follow();
    connect(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged, this, follow);
}
