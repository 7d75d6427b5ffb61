#include "Content.h"

#include <Requests.h>

#include <algorithm>
#include <iterator>

namespace pelliko::picker
{

using namespace companion;

namespace
{

constexpr const char *contactType = "application/vnd.tizen.contact";

std::string lastPart(const std::string &path)
{
    const size_t slash = path.find_last_of('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

Content filesIn(const std::vector<std::string> &paths)
{
    Content content{Content::Kind::files, {}, {}, 0, 0};
    std::transform(paths.begin(), paths.end(), std::back_inserter(content.names), lastPart);
    return content;
}

// Several at once, or one as a plain text: also the user's own card.
Content contactsIn(app_control_h request)
{
    const size_t several = extrasOf(request, APP_CONTROL_DATA_ID).size();
    return {Content::Kind::contacts, {}, {}, std::max<size_t>(several, 1), 0};
}

} // namespace

Content contentOf(app_control_h request)
{
    const std::string operation = operationOf(request);
    if (mimeOf(request) == contactType)
        return contactsIn(request);
    if (operation == APP_CONTROL_OPERATION_SHARE_TEXT)
        return {Content::Kind::text, {}, extraOf(request, APP_CONTROL_DATA_TEXT), 0, 0};
    const bool one = operation == APP_CONTROL_OPERATION_SHARE;
    if (!one && operation != APP_CONTROL_OPERATION_MULTI_SHARE)
        return {};
    if (const int32_t again = idOf(extraOf(request, "pk_reshare")); again != 0)
        return {Content::Kind::again, {}, {}, 0, again};
    return one ? filesIn({uriOf(request)}) : filesIn(extrasOf(request, APP_CONTROL_DATA_PATH));
}

std::vector<int32_t> recipientsOf(app_control_h request)
{
    std::vector<int32_t> ids;
    for (const std::string &element : extrasOf(request, APP_CONTROL_DATA_TO)) {
        if (const int32_t id = idOf(element.substr(0, element.find('|'))); id != 0)
            ids.push_back(id);
    }
    return ids;
}

} // namespace pelliko::picker
