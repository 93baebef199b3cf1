// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "panel/records.h"

#include <QFont>
#include <QStringList>
#include <QWidget>

class InfoPage;
class QAbstractButton;
class QComboBox;
class QFrame;
class QHBoxLayout;
class QVBoxLayout;
class ToolkitLabel;

/**
 * The body of the main window: date lines of both calendars, optional scene chooser, login and network pages, on-top
 * check box and links. It shows what it is handed and reports what the user does; it requests nothing itself. Its
 * surface is light on every desktop.
 */
class InfoWidget : public QWidget
{
    Q_OBJECT

public:
    /// @p showRelease decides whether the link that releases the terminal from control exists.
    InfoWidget(QWidget* parent, bool showRelease);

    void setLoginInfo(const TLoginInfo& info);
    void setNetInfo(const TNetInfo& info);

    /// Shows or hides the scene chooser and fixes the panel's height to suit. Show it once: each time adds a row.
    void setSceneBox(bool visible);

    /// Appends @p names to the scene chooser.
    void setSceneBoxData(const QStringList& names);
    void setCurrentScene(int index);
    QString getCurrentScene() const;

    /// Accepted and ignored: the panel has no message button.
    void setMessageButtonText(const QString& text);

    /// Starts refreshing the date lines, every 1,000,000 ms.
    void initTimer();

    /// Moves the window to the bottom-right corner of the primary screen.
    void initUIPos();

signals:
    void modifyPasswordClicked();
    void removeRegionClicked();
    void informationsClicked(); ///< never emitted by the panel
    void shutdownClicked();     ///< never emitted by the panel
    void environmentChanegd();  ///< the chosen scene changed, also while the chooser is being filled

public slots:
    /// Shows the page that @p button stands for.
    void onButtonClicked(QAbstractButton* button);

    /// Sets both date lines to today.
    void updateDateTimer();

    /// Keeps the window above others if @p state is Qt::Checked, and shows it at its place.
    void onOntopStatechanged(int state);

private:
    void createDateLabels();
    void createSceneBox();
    void createInfoUI();
    void initLoginInfoWidget();
    void initNetInfoWidget();
    QHBoxLayout* createBottomRow(bool showRelease);
    void layOut(bool showRelease);

    QFont m_baseFont;
    QFrame* m_line = nullptr;
    ToolkitLabel* m_date = nullptr;
    ToolkitLabel* m_lunarDate = nullptr;
    ToolkitLabel* m_sceneCaption = nullptr;
    QComboBox* m_sceneBox = nullptr;
    /// Whole, where the box shows them cut.
    QStringList m_sceneNames;
    QWidget* m_pages = nullptr;
    InfoPage* m_loginPage = nullptr;
    InfoPage* m_netPage = nullptr;
    QVBoxLayout* m_layout = nullptr;
};
