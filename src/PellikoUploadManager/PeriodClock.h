#pragma once

namespace pelliko
{

/// Seconds from a fixed point in the past to now. The point itself has no meaning (it depends on
/// the time zone): only the difference of two values counts.
double periodSeconds();

} // namespace pelliko
