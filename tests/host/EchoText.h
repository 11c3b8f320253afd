#pragma once

#include "RunningHost.h"

#include <string>

// The host's command that answers what it was asked, and its event, as they stand in frames.

namespace TestSupport {

inline std::string Echo(const std::string& correlation, const std::string& value)
{
    return "<ExecuteCommand><Name>Host.Echo</Name><Correlation>" + correlation +
           "</Correlation><Parameters><Parameter><Name>x</Name><Value>" + value +
           "</Value></Parameter></Parameters></ExecuteCommand>";
}

inline std::string EchoReply(const std::string& correlation, const std::string& value)
{
    return declaration + "<CommandReply><Name>Host.Echo</Name><Correlation>" + correlation +
           "</Correlation><Result>OK</Result><Parameters><Parameter><Name>x</Name><Value>" + value +
           "</Value></Parameter></Parameters></CommandReply>";
}

inline std::string Event(const std::string& name)
{
    return declaration + "<Event><Name>" + name + "</Name><Parameters/></Event>";
}

} // namespace TestSupport
