// SPDX-License-Identifier: Apache-2.0
#include "gethttpheader.h"

GetHttpHeader* GetHttpHeader::GetInstance()
{
    static GetHttpHeader instance;
    return &instance;
}

QString GetHttpHeader::header() const
{
    return QStringLiteral("v2");
}

void GetHttpHeader::apply(QNetworkRequest& request) const
{
    request.setHeader(QNetworkRequest::ContentTypeHeader, QStringLiteral("application/json"));
    request.setRawHeader("X-LUMO-VERSION", header().toLocal8Bit());
}
