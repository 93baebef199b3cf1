// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QLineEdit>
#include <QPointer>

class QTimer;
class ToolkitLabel;

/** A line edit with an alert state and, for a while, a message that says what is wrong. */
class ToolkitLineEdit : public QLineEdit
{
    Q_OBJECT

public:
    explicit ToolkitLineEdit(QWidget* parent = nullptr);
    ~ToolkitLineEdit() override;

    /// Marks the field as holding something wrong, or not any more.
    void setAlert(bool alert);
    bool isAlert() const { return m_alert; }

    /// Shows @p message literally in a bubble for @p ms milliseconds, or until hidden if @p ms is not positive. The
    /// bubble lies in the field behind its text where it fits there, else under the field or above it. It moves no
    /// other widget and takes neither focus nor clicks. An empty message hides it.
    void showAlertMessage(const QString& message, int ms = 3000);
    void hideAlertMessage();

    /// The message on show, else empty.
    QString alertMessage() const { return m_alertMessage; }

    QSize sizeHint() const override;

signals:
    void alertChanged(bool alert);

protected:
    bool event(QEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;
    void hideEvent(QHideEvent* event) override;

private:
    void placeBubble();

    bool m_alert = false;
    QString m_alertMessage;
    QPointer<ToolkitLabel> m_bubble;
    QTimer* m_bubbleTimer;
};
