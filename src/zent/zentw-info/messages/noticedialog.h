// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitdialog.h"

class QLabel;
class QPlainTextEdit;
class QPushButton;
class ToolkitBlurFrame;
class ToolkitPushButton;
class ToolkitSuggestButton;
struct NotifyMessage;
struct NotifyMessageResponse;

/**
 * Shows the newest unread message with its sender and time. With one unread message a wide button offers to mark it
 * read; with several there is one to close and one that steps on. What the buttons do is the opener's business.
 *
 * The dialog is made once; closing it only hides it. Its surface stays light in both themes.
 */
class NoticeDialog : public ToolkitDialog
{
    Q_OBJECT

public:
    /// @param userName the uid whose messages are asked for
    NoticeDialog(const QString& userName, QWidget* parent);

    /// Waits a second while events are handled; a call during the wait joins it. Then asks the service for the newest
    /// unread message, and shows it when the answer comes. An answer without a message leaves the visibility as it is,
    /// a failed one everything.
    void showNotice();

    /// Reads "已读" with one unread message, else "关闭".
    QPushButton* firstButton() const;
    /// Disabled by the opener while a message is being marked read; a refresh enables it again.
    QPushButton* nextButton() const;

    /// Whether the first button offers to mark the message on show as read, as opposed to closing the dialog.
    bool offersRead() const { return m_offersRead; }
    /// The message on show, empty before the first one.
    QString currentUuid() const { return m_currentUuid; }

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void createInterface();
    /// Made for the first message: text views load fonts, which a client without a message does without.
    void createTextViews();
    QPlainTextEdit* createTextView(int height, int weight, const QString& accessibleName);
    QLabel* createDetailLabel();
    QLayout* createButtons();
    void onMessageList(bool ok, const NotifyMessageResponse& response);
    void showMessage(const NotifyMessage& message);
    void updateButtons();

    ToolkitBlurFrame* m_contentFrame = nullptr;
    QPlainTextEdit* m_titleView = nullptr;
    QLabel* m_senderLabel = nullptr;
    QLabel* m_timeLabel = nullptr;
    QPlainTextEdit* m_contentView = nullptr;
    ToolkitPushButton* m_firstButton = nullptr;
    ToolkitSuggestButton* m_nextButton = nullptr;
    int m_total = 0;
    bool m_offersRead = false;
    /// Before a refresh's request.
    bool m_waits = false;
    QString m_currentUuid;
    QString m_userName;
};
