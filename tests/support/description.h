// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixture.h"
#include "themehelper.h"
#include "toolkitblurframe.h"

#include <QtWidgets>

/// What a window is made of, read from its widgets, timers and actions.
namespace description
{

/// What a layout leaves around and between its items, and the items in order: a widget, a layout or a spacer, with
/// stretch and alignment.
inline QString items(const QLayout* layout)
{
    const QMargins around = layout->contentsMargins();
    QString text =
        QString("%1,%2,%3,%4 ").arg(around.left()).arg(around.top()).arg(around.right()).arg(around.bottom());
    text += QString::number(layout->spacing());
    for (int i = 0; i < layout->count(); ++i) {
        QLayoutItem* item = layout->itemAt(i);
        text += item->widget() ? " w" : item->layout() ? " (" + items(item->layout()) + ")" : " s";
        if (QSpacerItem* spacer = item->spacerItem())
            text += QString("%1x%2").arg(spacer->sizeHint().width()).arg(spacer->sizeHint().height());
        const auto* box = qobject_cast<const QBoxLayout*>(layout);
        if (box && box->stretch(i) > 0)
            text += ':' + QString::number(box->stretch(i));
        if (const auto* grid = qobject_cast<const QGridLayout*>(layout)) {
            int row = 0, column = 0, rows = 0, columns = 0;
            grid->getItemPosition(i, &row, &column, &rows, &columns);
            text += QString("%1,%2").arg(row).arg(column);
        }
        if (item->alignment())
            text += '@' + QString::number(item->alignment());
    }
    return text;
}

/// The font that the widget was given, and its colours where they are not those of the light theme.
inline QString looks(const QWidget* widget)
{
    QString text;
    const QFont font = widget->testAttribute(Qt::WA_SetFont) ? widget->font() : QApplication::font();
    if (font.family() != QApplication::font().family())
        text += QString(" font %1 %2").arg(font.family()).arg(font.pixelSize() > 0 ? 0 : font.pointSize());
    if (font.pixelSize() > 0 || font.weight() != QFont::Normal)
        text += QString(" %1px %2").arg(font.pixelSize()).arg(font.weight());
    static const auto kRoles = QMetaEnum::fromType<QPalette::ColorRole>();
    static const QPalette kLight = ThemeHelper::palette(ThemeHelper::LightType);
    for (int role = 0; widget->testAttribute(Qt::WA_SetPalette) && role < QPalette::NColorRoles; ++role) {
        const QColor color = widget->palette().color(QPalette::ColorRole(role));
        if (color != kLight.color(QPalette::ColorRole(role)))
            text += QString(" %1 %2").arg(kRoles.valueToKey(role), color.name(QColor::HexArgb));
    }
    return text;
}

inline QString text(const QVariant& value)
{
    if (value.type() == QVariant::Pixmap)
        return text(value.value<QPixmap>().size() / value.value<QPixmap>().devicePixelRatio());
    if (value.type() == QVariant::Icon)
        return value.value<QIcon>().isNull() ? "none" : "some";
    if (value.type() == QVariant::Cursor)
        return QString::number(value.value<QCursor>().shape());
    if (value.type() == QVariant::Size)
        return QString("%1x%2").arg(value.toSize().width()).arg(value.toSize().height());
    if (value.type() == QVariant::SizePolicy)
        return QString("%1,%2")
            .arg(value.value<QSizePolicy>().horizontalPolicy())
            .arg(value.value<QSizePolicy>().verticalPolicy());
    QString text;
    QDebug(&text).nospace() << (value);
    return text.replace(QRegularExpression("^QVariant\\([^,]*, (.*)\\)$"), "\\1");
}

/// The properties that have another value than those of a new object of the same class of Qt.
inline QString properties(const QObject* object)
{
    // Never destroyed, since the application ends before.
    static const auto& kNew =
        *new QList<QObject*>{new QWidget,   new QFrame,    new QLabel,  new QLineEdit, new QPushButton, new QToolButton,
                             new QComboBox, new QCheckBox, new QDialog, new QTimer,    new QAction};
    // What the font, the layout or the platform decides, and what is read elsewhere.
    static const QRegularExpression kSkipped(
        "^(objectName|.*[gG]eometry|x|y|pos|(frameR|r)ect|(?!icon|minimumS|maximumS).*[sS]ize|.*Width|"
        ".*Height|width|height|children.*|.*sizeHint|.*SizeHint|font|palette|locale|"
        ".*isible|isActiveWindow|remainingTime|cursorPosition|displayText|windowIcon|"
        "autoRepeat.*|iconText)$");
    const QObject* base = nullptr;
    for (const QObject* one : kNew)
        base = object->metaObject()->inherits(one->metaObject()) ? one : base;
    QString line;
    for (int i = 0; i < object->metaObject()->propertyCount(); ++i) {
        const QMetaProperty property = object->metaObject()->property(i);
        const QString value = text(property.read(object));
        if (!kSkipped.match(property.name()).hasMatch() && (!base || value != text(base->property(property.name()))))
            line += QString(" %1=%2").arg(property.name(), value);
    }
    return line;
}

/// The words for what is set of the widget's attributes and states.
inline QString states(const QWidget* widget, const QWidget* window)
{
    QString words = widget->isVisibleTo(window) ? "" : " hidden";
    words += widget->focusPolicy() & Qt::TabFocus ? " tab" : "";
    words += widget->testAttribute(Qt::WA_InputMethodEnabled) ? " typing" : "";
    for (const auto attribute :
         {Qt::WA_Hover, Qt::WA_SetWindowIcon, Qt::WA_TranslucentBackground, Qt::WA_TransparentForMouseEvents,
          Qt::WA_DeleteOnClose, Qt::WA_QuitOnClose, Qt::WA_ShowWithoutActivating}) {
        if (widget->testAttribute(attribute) && (attribute != Qt::WA_QuitOnClose || widget->isWindow()))
            words += QString(" %1").arg(QMetaEnum::fromType<Qt::WidgetAttribute>().valueToKey(attribute)).remove("WA_");
    }
    return words;
}

inline QString line(const QObject* object, const QWidget* window)
{
    const QString name = QString("%1 \"%2\"").arg(object->metaObject()->className(), object->objectName());
    const auto* widget = qobject_cast<const QWidget*>(object);
    if (!widget)
        return name + properties(object);
    QString line;
    if (widget->isWindow())
        line += ' ' + QString::number(widget->windowFlags(), 16);
    else if (!widget->parentWidget()->layout())
        line += QString(" at %1,%2").arg(widget->x()).arg(widget->y());
    if (widget->layout())
        line += " layout " + items(widget->layout());
    if (const auto* edit = qobject_cast<const QLineEdit*>(widget))
        line += QString(" margins %1,%2").arg(edit->textMargins().left()).arg(edit->textMargins().right());
    if (const auto* frame = qobject_cast<const ToolkitBlurFrame*>(widget))
        line += QString(" mask %1 %2 %3").arg(frame->maskColor().name()).arg(frame->maskAlpha()).arg(frame->radius());
    return name + line + properties(widget) + states(widget, window) + looks(widget);
}

/// Fails where the window and its children are not as these lines say, where an asterisk stands for anything.
inline void compare(const QWidget* window, const QJsonValue& lines)
{
    QStringList got{line(window, window)};
    for (const QObject* child : window->findChildren<QObject*>()) {
        if (child->isWidgetType() || qobject_cast<const QTimer*>(child) || qobject_cast<const QAction*>(child))
            got.append(line(child, window));
    }
    fixture::compareLines(got, lines);
}

} // namespace description
