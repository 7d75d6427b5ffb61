#include "ReplyToken.h"

#include "app_control.h"

#include <utility>

namespace pelliko::platform
{

ReplyToken::ReplyToken(Answer answer) : answer_(std::move(answer)) {}

ReplyToken::~ReplyToken()
{
    answer(APP_CONTROL_RESULT_CANCELED, g_variant_new("a{sv}", nullptr));
}

bool ReplyToken::answer(int result, GVariant *extras)
{
    if (answered_.exchange(true)) {
        g_variant_unref(g_variant_ref_sink(extras));
        return false;
    }
    answer_(result, extras);
    return true;
}

} // namespace pelliko::platform
