#pragma once

namespace zent
{

/// Keeps the process small over weeks: what a large reply needed goes back to the system when the reply is done with.
/// Called first of all, before there are threads.
void boundHeap();

} // namespace zent
