// Lists of recipients and of files inside one text: each item ends with "?", and the texts are cut
// to their buffers.
#include "Promise.h"

#include "PellikoApp/AppData.h"
#include "PellikoDatabaseManager/FileListText.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadingDataManager/MarkedList.h"
#include "PellikoUploadingDataManager/StatusRecipients.h"

#include <algorithm>
#include <cstring>
#include <glib.h>
#include <memory>
#include <string>
#include <vector>

using namespace pelliko;
using pelliko::fuzz::promise;

namespace
{

using Texts = std::vector<std::string>;

std::string joined(const Texts &items)
{
    std::string text;
    for (const std::string &item : items)
        text += item + "?";
    return text;
}

bool isUtf8(std::string_view text)
{
    return g_utf8_validate_len(text.data(), text.size(), nullptr);
}

void tryMarkedList(const std::string &text)
{
    const Texts items = splitMarkedList(text);
    const std::string again = joined(items);
    promise(again == text || again == text + "?", "a list that is put together again is the same");
    for (const std::string &item : items)
        promise(item.find('?') == std::string::npos, "an item ends at its mark");
}

void promiseCut(const std::string &whole, const char *cut, size_t size)
{
    const std::string_view kept(cut);
    promise(kept.size() < size && whole.starts_with(kept), "a cut text is the beginning of it");
    promise(kept.size() == whole.size() || kept.size() + 4 >= size, "no more is cut than needed");
    promise(!isUtf8(whole) || isUtf8(kept), "a text is cut between characters");
}

void tryTexts(const std::string &text)
{
    setRecipientTexts(text.c_str(), text.c_str());
    const std::string whole = text.c_str();
    promiseCut(whole, getRecipientListText(), recipientListSize);
    promiseCut(whole, getRecipientIndexListText(), recipientIndexSize);
    setRecipientTexts(getRecipientListText(), getRecipientIndexListText());
    promiseCut(whole, getRecipientListText(), recipientListSize);
}

// One recipient a line: "Name" or "Name+SMS"; the line's place is the number id.
void tryRecipients(const Texts &names)
{
    PellikoAppData record;
    record.upload_item = createUploadData();
    int32_t id = 0;
    for (const std::string &name : names) {
        auto *recipient = new UploadRecipient;
        recipient->number_id = ++id;
        recipient->is_sms = _checkSmsReceiver(name) ? 1 : 0;
        recipient->name = g_strdup(name.c_str());
        record.upload_item->recipient_list =
            eina_list_append(record.upload_item->recipient_list, recipient);
    }
    _populateExtraData(&record);
    const Texts ids = splitMarkedList(getRecipientIndexListText());
    const Texts shown = splitMarkedList(getRecipientListText());
    promise(ids.size() <= names.size(), "no recipient is counted twice");
    const bool fits = std::strlen(getRecipientListText()) < recipientListSize - 4;
    const bool marked = std::any_of(names.begin(), names.end(), [](const std::string &name) {
        return name.find('?') != std::string::npos;
    });
    promise(!fits || marked || shown.size() == names.size(), "every recipient is in the list");
    freeUploadData(record.upload_item);
    record.upload_item = nullptr;
}

Texts taken(char **paths)
{
    const std::unique_ptr<char *, decltype(&g_strfreev)> owned(paths, g_strfreev);
    Texts items;
    for (char **path = paths; *path; ++path)
        items.emplace_back(*path);
    return items;
}

void tryFiles(const Texts &paths)
{
    std::vector<const char *> array;
    for (const std::string &path : paths)
        array.push_back(path.c_str());
    array.push_back(nullptr);
    const auto count = static_cast<int32_t>(paths.size());
    const std::string text = fileListText(array.data(), count);
    promise(text.size() < fileListSize, "the list fits into its column");
    const Texts again = taken(splitFileList(text.c_str(), count));
    const bool plain = std::all_of(paths.begin(), paths.end(), [](const std::string &path) {
        return !path.empty() && path.find('?') == std::string::npos;
    });
    promise(!plain || text.size() == fileListSize - 1 || again == paths,
            "paths come back as they were");
    promise(again.size() <= paths.size() * 64, "the list has an end");
}

void tryStoredFiles(const std::string &text, int32_t count)
{
    for (const std::string &path : taken(splitFileList(text.c_str(), count)))
        promise(!path.empty() && path.find('?') == std::string::npos, "a path ends at its mark");
}

Texts linesOf(std::string_view text)
{
    Texts lines;
    while (!text.empty())
        lines.emplace_back(std::string(pelliko::fuzz::takeLine(text)).c_str());
    return lines;
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int *, char ***)
{
    eina_init();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(pelliko::fuzz::textOf(data, size));
    tryMarkedList(text);
    tryTexts(text);
    tryRecipients(linesOf(text));
    tryFiles(linesOf(text));
    tryStoredFiles(text, size > 0 ? static_cast<int8_t>(data[0]) : 0);
    return 0;
}
