#pragma once

#include "ControlStreamClient/Client.h"
#include "device/ScriptedHost.h"

#include <ostream>
#include <string>

// What the tests of the client share.

/// For what is sure to come; only spent where a test fails.
constexpr std::chrono::milliseconds Patient{60000};

/// For what is sure not to come.
constexpr std::chrono::milliseconds Hasty{30};

inline ControlStream::VClientOptions WithLimit(std::chrono::milliseconds limit)
{
    ControlStream::VClientOptions options;
    options.TimeLimit = limit;
    return options;
}

/// What an operation threw, to be compared as a whole.
struct VThrown
{
    ControlStream::EErrorKind Kind;
    std::string Text;

    bool operator==(const VThrown& other) const { return Kind == other.Kind && Text == other.Text; }

    friend std::ostream& operator<<(std::ostream& stream, const VThrown& thrown)
    {
        return stream << "kind " << static_cast<int>(thrown.Kind) << ": " << thrown.Text;
    }
};

/// Returns what the operation throws; one that throws nothing has an impossible kind.
template <typename Operation>
VThrown ThrownBy(Operation operation)
{
    try {
        operation();
    } catch (const ControlStream::VError& error) {
        return {error.Kind(), error.what()};
    }
    return {static_cast<ControlStream::EErrorKind>(-1), "nothing was thrown"};
}

inline std::string EventText(const std::string& name, const std::string& value = "v")
{
    return Declaration + ("<Event><Name>" + name) +
           "</Name><Parameters><Parameter><Name>p</Name><Value>" + value +
           "</Value></Parameter></Parameters></Event>";
}

inline std::string ReplyText(const std::string& correlation, const std::string& result = "OK")
{
    return Declaration + ("<CommandReply><Name>Go</Name><Correlation>" + correlation) +
           "</Correlation><Result>" + result + "</Result><Parameters/></CommandReply>";
}

inline std::string ServerInformationText()
{
    return Declaration + std::string(R"(<ServerInformation><StreamVersion major="1" minor="0"/>)"
                                     "</ServerInformation>");
}
