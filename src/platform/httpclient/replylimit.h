#pragma once

/// What is common to all replies, whichever way they come in.
namespace zent::http
{

/// The largest body that is read.
constexpr long kMaxReplyBytes = 16L * 1024 * 1024;

} // namespace zent::http
