#include "QuorixPluginControlStreamServer/Authorization/ServerName.h"

#include <QCoreApplication>

#include <boost/asio/ip/host_name.hpp>

std::string MakeServerName()
{
    return MakeServerName(boost::asio::ip::host_name());
}

std::string MakeServerName(const std::string& computer)
{
    return QCoreApplication::applicationName().toStdString() + " on " + computer;
}
