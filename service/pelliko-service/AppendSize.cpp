#include "AppendSize.h"

#include <algorithm>

namespace pelliko::service
{
namespace
{
// Four times the bytes then still take about a second.
constexpr int64_t fastMs = 250;
constexpr int64_t slowMs = 4'000;
constexpr int64_t growth = 4;
} // namespace

AppendSize::AppendSize(int64_t most) : least_(std::min(first, most)), most_(most), bytes_(least_) {}

void AppendSize::tookMs(int64_t milliseconds)
{
    if (milliseconds < fastMs) {
        bytes_ = bytes_ > most_ / growth ? most_ : bytes_ * growth;
    } else if (milliseconds > slowMs) {
        bytes_ = std::max(bytes_ / growth, least_);
    }
}

} // namespace pelliko::service
