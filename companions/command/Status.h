// How the uploads stand.
#pragma once

#include "Output.h"

namespace pelliko::command
{

/// Lists what was sent, newest first. Following, it prints what is on its way and then each change
/// of it as a line, until nothing is on its way any more: failed when one of those uploads failed.
Exit showStatus(bool follow, bool asJson);

} // namespace pelliko::command
