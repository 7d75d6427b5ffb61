#include "Sharing.h"

#include "Contacts.h"
#include "Files.h"
#include "People.h"

#include <app_control.h>
#include <app_control_delivery.h>
#include <contacts.h>
#include <contacts_new_number.h>
#include <glib.h>

#include <algorithm>
#include <iostream>
#include <iterator>
#include <memory>
#include <new>
#include <type_traits>
#include <unistd.h>

namespace pelliko::command
{
namespace
{

constexpr const char *application = "com.velmora.pelliko";
constexpr const char *picker = "com.velmora.pelliko-picker";
// One request to share names no more people; it would pass over the rest without a word.
constexpr std::size_t mostRecipients = 10;
// What is longer is a file rather than a text.
constexpr std::size_t longestText = 1024UL * 1024UL;

struct Destroy {
    void operator()(app_control_h request) const { app_control_destroy(request); }
};
using Request = std::unique_ptr<std::remove_pointer_t<app_control_h>, Destroy>;

Request requestTo(const char *receiver, const char *operation)
{
    app_control_h request = nullptr;
    if (app_control_create(&request) != APP_CONTROL_ERROR_NONE)
        throw std::bad_alloc();
    app_control_set_app_id(request, receiver);
    app_control_set_operation(request, operation);
    return Request(request);
}

void addTexts(const Request &request, const char *key, const std::vector<std::string> &texts)
{
    std::vector<const char *> pointers;
    pointers.reserve(texts.size());
    for (const std::string &text : texts)
        pointers.push_back(text.c_str());
    app_control_add_extra_data_array(request.get(), key, pointers.data(),
                                     static_cast<int>(pointers.size()));
}

// The recipients of a command line: ids of numbers, in order and each once.
struct Recipients {
    std::vector<std::string> ids;
    Exit status = Exit::done;
};

// Only numbers of the contacts can be shared with: who is not there yet becomes a contact.
std::string idOf(const std::string &number, std::string &fault)
{
    int id = 0;
    if (contacts_find_or_add_number(number.c_str(), &id) != CONTACTS_ERROR_NONE)
        fault = printable(number) + " cannot be added to the contacts";
    return std::to_string(id);
}

// All are looked for before any is added: a mistake changes nothing.
bool findAll(const std::vector<std::string> &to, std::vector<Found> &found, Recipients &recipients)
{
    std::vector<companion::ContactNumber> contacts;
    if (recipients.status = readContacts(contacts); recipients.status != Exit::done)
        return false;
    for (const std::string &who : to) {
        found.push_back(findPerson(who, contacts));
        if (!found.back().fault.empty()) {
            recipients.status = refuse(Exit::recipient, found.back().fault);
            return false;
        }
    }
    return true;
}

Recipients recipientsOf(const std::vector<std::string> &to)
{
    Recipients recipients;
    std::vector<Found> found;
    if (to.size() > mostRecipients)
        recipients.status =
            refuse(Exit::recipient,
                   "a share has at most " + std::to_string(mostRecipients) + " recipients");
    if (to.empty() || recipients.status != Exit::done || !findAll(to, found, recipients))
        return recipients;
    for (const Found &person : found) {
        std::string fault;
        const std::string id =
            person.id != 0 ? std::to_string(person.id) : idOf(person.number, fault);
        if (!fault.empty()) {
            recipients.status = refuse(Exit::recipient, fault);
            return recipients;
        }
        if (std::find(recipients.ids.begin(), recipients.ids.end(), id) == recipients.ids.end())
            recipients.ids.push_back(id);
    }
    return recipients;
}

Exit deliver(const Request &request, bool toPicker)
{
    const std::string who = toPicker ? "the recipient picker" : "Pelliko";
    switch (app_control_deliver_launch_request(request.get())) {
    case APP_CONTROL_ERROR_NONE:
        return Exit::done;
    case APP_CONTROL_ERROR_APP_NOT_FOUND:
        return refuse(Exit::unreachable, who + " is not installed for this session" +
                                             (toPicker ? "; name recipients with --to" : ""));
    case APP_CONTROL_ERROR_IO_ERROR:
        return refuse(Exit::unreachable, "there is no session bus, so Pelliko cannot be started");
    default:
        return refuse(Exit::unreachable, who + " could not be started");
    }
}

const char *receiverFor(const Recipients &recipients)
{
    return recipients.ids.empty() ? picker : application;
}

Exit send(const Request &request, const Recipients &recipients)
{
    if (!recipients.ids.empty()) {
        addTexts(request, APP_CONTROL_DATA_TO, recipients.ids);
        // Whose view of the contacts the people were picked in: the usage statistics tell by it
        // that these are contacts.
        app_control_add_extra_data(request.get(), "ct_app_id", application);
    }
    return deliver(request, recipients.ids.empty());
}

std::string readInput()
{
    return {std::istreambuf_iterator<char>(std::cin), std::istreambuf_iterator<char>()};
}

std::string joined(const std::vector<std::string> &words)
{
    std::string text;
    for (const std::string &word : words)
        text += (text.empty() ? "" : " ") + word;
    return text;
}

// Why a text cannot be shared; empty when it can.
std::string faultOfText(const std::string &text)
{
    if (text.find_first_not_of(" \t\r\n") == std::string::npos)
        return "the text is empty, so there is nothing to share";
    if (text.size() > longestText)
        return "the text is longer than 1 MiB; share it as a file";
    if (!g_utf8_validate(text.data(), static_cast<gssize>(text.size()), nullptr))
        return "this is not text (UTF-8); share it as a file";
    return {};
}

} // namespace

Exit shareFiles(const std::vector<std::string> &names, const std::vector<std::string> &to)
{
    const NamedFiles files = readFiles(names);
    if (!files.fault.empty())
        return refuse(Exit::failed, files.fault);
    const Recipients recipients = recipientsOf(to);
    if (recipients.status != Exit::done)
        return recipients.status;
    const bool single = files.paths.size() == 1;
    const Request request =
        requestTo(receiverFor(recipients),
                  single ? APP_CONTROL_OPERATION_SHARE : APP_CONTROL_OPERATION_MULTI_SHARE);
    if (single)
        app_control_set_uri(request.get(), files.paths.front().c_str());
    else
        addTexts(request, APP_CONTROL_DATA_PATH, files.paths);
    return send(request, recipients);
}

Exit shareText(const std::vector<std::string> &words, const std::vector<std::string> &to)
{
    const bool fromInput = words.empty() || (words.size() == 1 && words.front() == "-");
    if (words.empty() && isatty(STDIN_FILENO) == 1)
        return refuse(Exit::usage, "there is no text: name it, or give it on standard input");
    const std::string text = fromInput ? readInput() : joined(words);
    if (const std::string fault = faultOfText(text); !fault.empty())
        return refuse(Exit::failed, fault);
    const Recipients recipients = recipientsOf(to);
    if (recipients.status != Exit::done)
        return recipients.status;
    const Request request = requestTo(receiverFor(recipients), APP_CONTROL_OPERATION_SHARE_TEXT);
    app_control_add_extra_data(request.get(), APP_CONTROL_DATA_TEXT, text.c_str());
    return send(request, recipients);
}

} // namespace pelliko::command
