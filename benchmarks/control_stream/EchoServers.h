#pragma once

#include <string>

namespace ControlStreamBenchmark {

/// Writes a frame to a blocking or non-blocking socket as the host does: header and text gathered
/// in one call, repeated until the kernel has taken the last byte. A dead peer is passed over.
void WriteFrame(int socket, const std::string& frame);

/// Serves `listener` with one thread of Boost.Asio: an asynchronous read of the 4 bytes of the
/// header, one of as many bytes as it says, `reply` in one blocking write, and again. Never
/// returns.
void ServeWithAsio(int listener, const std::string& reply);

/// The same with epoll and plain calls.
void ServeWithEpoll(int listener, const std::string& reply);

} // namespace ControlStreamBenchmark
