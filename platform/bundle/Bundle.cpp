#include "bundle.h"

#include <map>
#include <new>
#include <string>

struct _bundle_t {
    std::map<std::string, std::string, std::less<>> texts;
};

namespace
{

bool isName(const char *key)
{
    return key && *key;
}

bundle *handOut(bundle *made)
{
    set_last_result(made ? BUNDLE_ERROR_NONE : BUNDLE_ERROR_OUT_OF_MEMORY);
    return made;
}

} // namespace

bundle *bundle_create(void)
{
    return handOut(new (std::nothrow) bundle);
}

int bundle_free(bundle *b)
{
    if (!b)
        return BUNDLE_ERROR_INVALID_PARAMETER;
    delete b;
    return BUNDLE_ERROR_NONE;
}

int bundle_add_str(bundle *b, const char *key, const char *str)
{
    if (!b || !isName(key) || !str)
        return BUNDLE_ERROR_INVALID_PARAMETER;
    return b->texts.emplace(key, str).second ? BUNDLE_ERROR_NONE : BUNDLE_ERROR_KEY_EXISTS;
}

int bundle_get_str(bundle *b, const char *key, char **str)
{
    if (!b || !isName(key) || !str)
        return BUNDLE_ERROR_INVALID_PARAMETER;
    const auto found = b->texts.find(key);
    if (found == b->texts.end())
        return BUNDLE_ERROR_KEY_NOT_AVAILABLE;
    *str = found->second.data();
    return BUNDLE_ERROR_NONE;
}

int bundle_get_count(bundle *b)
{
    set_last_result(b ? BUNDLE_ERROR_NONE : BUNDLE_ERROR_INVALID_PARAMETER);
    return b ? static_cast<int>(b->texts.size()) : 0;
}

bundle *bundle_dup(bundle *b_from)
{
    if (!b_from) {
        set_last_result(BUNDLE_ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    return handOut(new (std::nothrow) bundle(*b_from));
}
