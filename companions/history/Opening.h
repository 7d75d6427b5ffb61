// What a launch request wants the history to show.
#pragma once

#include <app_control.h>

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::history
{

enum class Kind { sent, received };

struct Opening {
    enum class What {
        /// The user wants to see a list.
        show,
        /// Shares ended or arrived while the history was open: the lists change, and the user is
        /// left
        /// where he is.
        news
    };
    What what = What::show;
    Kind kind = Kind::sent;
    /// The request that ended, 0 when none.
    int32_t request = 0;
    /// The shares that arrived.
    std::vector<std::string> tokens;
};

/// @param shown the list that is shown now, or would be
Opening openingOf(app_control_h request, Kind shown);

} // namespace pelliko::history
