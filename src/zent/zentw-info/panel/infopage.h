// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QVector>
#include <QWidget>

class ToolkitLabel;

/** One page of the information panel: a column of captions and, beside it, a column of values. */
class InfoPage : public QWidget
{
    Q_OBJECT

public:
    struct Row {
        QString caption;
        const char* captionName; ///< object name of the caption label
        const char* valueName;   ///< object name of the value label
    };
    enum class Overflow {
        Clip,  ///< show the text as it is
        Elide, ///< shorten a text that is too wide in its middle and make the whole text the tool tip
    };

    InfoPage(const QVector<Row>& rows, QWidget* parent);

    /// Makes one caption, which needs more room than the others, @p width pixels wide.
    void setCaptionWidth(int row, int width);

    /// Shows @p whole in @p row, cut where it is very long. A tool tip that an earlier, longer text left is not
    /// removed.
    void setValue(int row, const QString& whole, Overflow overflow);

private:
    QVector<ToolkitLabel*> m_captions;
    QVector<ToolkitLabel*> m_values;
};
