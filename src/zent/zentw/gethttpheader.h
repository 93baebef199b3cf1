// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QNetworkRequest>
#include <QObject>
#include <QString>

/// The API version that the client names in the requests it builds itself.
class GetHttpHeader : public QObject
{
    Q_OBJECT

public:
    /// The one instance, made on first use.
    static GetHttpHeader* GetInstance();

    /// The API version text.
    QString header() const;

    /// Marks `request` as JSON and puts the version header on it.
    void apply(QNetworkRequest& request) const;

private:
    GetHttpHeader() = default;
};
