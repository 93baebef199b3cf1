// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractButton>
#include <QList>
#include <QWidget>

class QButtonGroup;
class QHBoxLayout;

/** One segment of a ToolkitButtonBox: a flat button whose checked state is a raised plate. */
class ToolkitButtonBoxButton : public QAbstractButton
{
    Q_OBJECT

public:
    explicit ToolkitButtonBoxButton(const QString& text, QWidget* parent = nullptr);
    QSize sizeHint() const override;

protected:
    void paintEvent(QPaintEvent* event) override;
};

/**
 * A segmented control: buttons in a row on one track, of which at most one is checked. Tab stops at the control once;
 * the arrow keys move between its segments.
 */
class ToolkitButtonBox : public QWidget
{
    Q_OBJECT

public:
    explicit ToolkitButtonBox(QWidget* parent = nullptr);

    /// Replaces the segments. The box becomes the buttons' parent; the buttons it had are deleted. @p checkable
    /// makes the buttons keep a checked state; without it they are plain push segments.
    void setButtonList(const QList<QAbstractButton*>& buttons, bool checkable);

    /// Appends one segment, checkable like those set before (checkable in a new box).
    void addButton(QAbstractButton* button);

    /// The segments from left to right.
    QList<QAbstractButton*> buttonList() const;

    /// The checked segment, or null.
    QAbstractButton* checkedButton() const;

signals:
    /// The user chose @p button, by mouse or by key.
    void buttonClicked(QAbstractButton* button);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    QButtonGroup* m_group;
    QHBoxLayout* m_layout;
    bool m_checkable = true;
};
