// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/** What the login page of the panel shows: the terminal and the person working at it. */
struct TLoginInfo {
    QString terminalAlias;    ///< the terminal's alias as registered with the management server
    QString organizationName; ///< the organisation the user belongs to
    QString personName;       ///< the person's full name
    QString jobNumber;        ///< the person's staff number
    QString spare;            ///< unused
    QString department;       ///< the person's department
};

/** What the network page of the panel shows: the terminal's active connection, as text ready for display. */
struct TNetInfo {
    QString hostName;
    QString userName;
    QString mac;
    QString ipv4;
    QString gateway;
    QString dns;
    QString subnetMask;
    QString speed;
};
