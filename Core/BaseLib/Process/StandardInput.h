#pragma once

#include <QByteArray>

#include <cstddef>

/// Reads what others write to this process while it works on something else.
namespace StandardInput {

/// Bytes that are taken at once, at most.
inline constexpr std::size_t kMostArrived = 4096;

/// What has arrived on the standard input since the last call, or the first part of it. Never waits. Empty
/// for an input that is closed, and on Windows for one that is no pipe.
QByteArray takeArrived();

} // namespace StandardInput
