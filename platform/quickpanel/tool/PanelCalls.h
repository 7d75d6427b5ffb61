// Calls of the tool to the panel service; each throws std::runtime_error with one sentence when it
// fails.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Variant.h"

namespace pelliko::quickpanel_tool
{

using notification::Variant;

// Of one application, or of all when app is empty.
std::vector<Variant> postedNotifications(const std::string &app);
std::vector<Variant> pastEvents();

// The private id that a person means: the one posted notification with that tag, else that private
// id.
int64_t resolve(const std::string &id_or_tag, const std::string &app);
void tap(int64_t id);
void swipe(int64_t id);

} // namespace pelliko::quickpanel_tool
