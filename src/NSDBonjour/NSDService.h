#pragma once

#include <QMetaType>
#include <QString>

/// A service on the network, as DNS-SD knows it. A plain value, which travels through queued
/// signals under the name "VNSDService".
struct VNSDService
{
    QString Name;
    QString RegisteredType;
    QString ReplyDomain;
};

Q_DECLARE_METATYPE(VNSDService)
