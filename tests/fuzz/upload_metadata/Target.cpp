// The Upload-Metadata header of a client that only knows tus, and the file name and type in it.
#include "FileName.h"

#include "http/Errors.h"
#include "shares/FileNames.h"
#include "text/Base64.h"
#include "text/Escape.h"
#include "tus/TusHeaders.h"

#include <map>
#include <optional>
#include <set>
#include <vector>

using namespace pelliko::server;
using pelliko::fuzz::promise;
using pelliko::fuzz::promiseFileName;

namespace
{

using Metadata = std::map<std::string, std::string>;

std::optional<Metadata> parsed(std::string_view header)
{
    try {
        return parseUploadMetadata(header);
    } catch (const Refusal &) {
        return std::nullopt;
    }
}

std::string headerOf(const Metadata &metadata)
{
    std::string header;
    for (const auto &[key, value] : metadata)
        header += (header.empty() ? "" : ",") + key + " " + base64(value);
    return header;
}

std::string lowerCase(std::string text)
{
    for (char &letter : text)
        letter = g_ascii_tolower(letter);
    return text;
}

void tryName(const std::string &outside)
{
    const std::string name = cleanFileName(outside);
    promiseFileName(name);
    promise(cleanFileName(name) == name, "a clean name stays as it is");
    const std::string header = attachmentDisposition(name);
    promise(header.find_first_of("\r\n") == std::string::npos, "a name ends no header line");
    promise(std::count(header.begin(), header.end(), '"') == 2, "a name ends no quotes");
}

void tryType(const std::string &outside)
{
    const std::string type = cleanType(outside);
    promise(type.find_first_of("\r\n;\" ") == std::string::npos, "a type is one word");
    promise(std::count(type.begin(), type.end(), '/') == 1, "a type has two parts");
    promise(cleanType(type) == type, "a clean type stays as it is");
}

void tryTogether(const Metadata &metadata)
{
    std::vector<std::string> names;
    for (const auto &[key, value] : metadata)
        names.insert(names.end(), 2, cleanFileName(isUtf8(value) ? value : "photo.jpg"));
    std::set<std::string> different;
    for (const std::string &name : uniqueNames(names)) {
        promiseFileName(name);
        promise(different.insert(lowerCase(name)).second, "names of one share differ");
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string_view header = pelliko::fuzz::textOf(data, size);
    promise(base64Decode(base64(header)) == header, "base64 brings every byte back");
    if (isUtf8(header))
        tryName(std::string(header));
    const std::optional<Metadata> metadata = parsed(header);
    if (!metadata)
        return 0;
    promise(parsed(headerOf(*metadata)) == metadata, "metadata that is written is read again");
    for (const auto &[key, value] : *metadata) {
        tryType(value);
        if (isUtf8(value))
            tryName(value);
    }
    tryTogether(*metadata);
    return 0;
}
