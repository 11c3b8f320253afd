#include "DeviceConnection.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <system_error>

namespace ControlStreamBenchmark {

namespace {

constexpr std::size_t headerBytes = 4;
constexpr std::size_t longestReply = 4096;
constexpr time_t silenceSeconds = 30;

[[noreturn]] void ThrowErrno(const char* what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

int Connect(std::uint16_t port, std::uint8_t lastByte)
{
    const int connected = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl((INADDR_LOOPBACK & ~0xFFU) | lastByte);
    if (connect(connected, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) {
        const int error = errno;
        close(connected);
        errno = error;
        return -1;
    }
    // A server that falls silent ends the benchmark instead of stopping it.
    const timeval limit{silenceSeconds, 0};
    setsockopt(connected, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
    return connected;
}

} // namespace

std::string MakeFrame(const std::string& text)
{
    std::string frame;
    for (std::size_t index = 0; index < headerBytes; ++index) {
        frame += static_cast<char>((text.size() >> (8 * index)) & 0xFF);
    }
    return frame + text;
}

std::string ExecuteCommandFrame()
{
    return MakeFrame(
        R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
        "<ExecuteCommand><Name>Host.Echo</Name><Correlation>1042</Correlation><Parameters>"
        "<Parameter><Name>Camera</Name><Value>qx:1</Value></Parameter>"
        "<Parameter><Name>StrobeIntensity</Name><Value>0.5</Value></Parameter>"
        "</Parameters></ExecuteCommand>");
}

std::string ReadStrobeFrame()
{
    return MakeFrame(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                     "<ExecuteCommand><Name>CameraSettings_GetStrobeIntensity</Name>"
                     "<Correlation>1042</Correlation><Parameters>"
                     "<Parameter><Name>Param_CameraDeviceId</Name><Value>1</Value></Parameter>"
                     "</Parameters></ExecuteCommand>");
}

std::string ServerInformationFrame()
{
    return MakeFrame(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                     "<ServerInformation/>");
}

bool CanConnect(std::uint16_t port)
{
    const int connected = Connect(port, 1);
    if (connected >= 0) {
        close(connected);
    }
    return connected >= 0;
}

VDeviceConnection::VDeviceConnection(std::uint16_t port, std::uint8_t lastByte)
    : socket(Connect(port, lastByte))
{
    if (socket < 0) {
        ThrowErrno("connect");
    }
}

VDeviceConnection::VDeviceConnection(VDeviceConnection&& other) noexcept : socket(other.socket)
{
    other.socket = -1;
}

VDeviceConnection::~VDeviceConnection()
{
    if (socket >= 0) {
        close(socket);
    }
}

std::string VDeviceConnection::ReadFrame()
{
    std::array<unsigned char, headerBytes> header{};
    Read(reinterpret_cast<char*>(header.data()), header.size());
    const std::size_t length = header[0] | header[1] << 8U | header[2] << 16U | header[3] << 24U;
    std::string frame(header.begin(), header.end());
    frame.resize(headerBytes + length);
    Read(frame.data() + headerBytes, length);
    return frame;
}

std::string VDeviceConnection::Ask(const std::string& request)
{
    Send(request);
    return ReadFrame();
}

void VDeviceConnection::Exchange(const std::string& request, const std::string& reply)
{
    std::array<char, longestReply> buffer; // not filled: it would be work beside the exchange
    if (reply.size() > buffer.size()) {
        throw std::runtime_error("the reply is longer than this benchmark expects");
    }
    Send(request);
    Read(buffer.data(), reply.size());
    if (std::memcmp(buffer.data(), reply.data(), reply.size()) != 0) {
        throw std::runtime_error("the server gave another reply than before: " +
                                 std::string(buffer.data(), reply.size()));
    }
}

void VDeviceConnection::SetQuickAcknowledgement(bool quick)
{
    const int value = quick ? 1 : 0;
    if (setsockopt(socket, IPPROTO_TCP, TCP_QUICKACK, &value, sizeof value) != 0) {
        ThrowErrno("TCP_QUICKACK");
    }
}

void VDeviceConnection::Send(const std::string& bytes)
{
    for (std::size_t sent = 0; sent < bytes.size();) {
        const ssize_t size = send(socket, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (size < 0 && errno != EINTR) {
            ThrowErrno("send");
        }
        sent += size > 0 ? static_cast<std::size_t>(size) : 0;
    }
}

void VDeviceConnection::Read(char* target, std::size_t size)
{
    while (size > 0) {
        const ssize_t got = recv(socket, target, size, 0);
        if (got == 0) {
            throw std::runtime_error("the server has ended the connection");
        }
        if (got < 0 && errno != EINTR) {
            ThrowErrno("recv");
        }
        if (got > 0) {
            target += got;
            size -= static_cast<std::size_t>(got);
        }
    }
}

} // namespace ControlStreamBenchmark
