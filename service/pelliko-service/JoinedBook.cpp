#include "JoinedBook.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int64_t soonMs = 2'000; // an import of contacts comes in many steps
constexpr int64_t hourMs = 3'600'000;
constexpr int64_t dayMs = 24 * hourMs;
constexpr int64_t daySeconds = 24LL * 3600;
constexpr int64_t mostPerDay = 1'000;
} // namespace

JoinedBook::JoinedBook(RequestContext &context, UploadQueue &queue, ContactMarks &contacts)
    : context_(context), store_(queue), contacts_(contacts),
      backoff_(60'000, hourMs, context.random), self_(std::make_shared<JoinedBook *>(this))
{
}

JoinedBook::~JoinedBook()
{
    context_.timers.cancel(timer_);
}

void JoinedBook::lookSoon()
{
    if (busy_) {
        changed_ = true;
    } else if (!std::exchange(soon_, true)) {
        lookAfter(soonMs); // a look that is near is not put off by every further change
    }
}

void JoinedBook::networkChanged()
{
    if (!busy_ && wait_ < dayMs) {
        lookSoon();
    }
}

void JoinedBook::lookAfter(int64_t milliseconds)
{
    context_.timers.cancel(timer_);
    timer_ = context_.timers.after(milliseconds, [this] {
        timer_ = 0;
        soon_ = false;
        look();
    });
}

void JoinedBook::look()
{
    const auto account = context_.account();
    if (!account) {
        return; // an account comes here again
    }
    account_ = *account;
    busy_ = true;
    changed_ = false;
    wait_ = dayMs;
    contacts_.read(account_.number, [weak = std::weak_ptr<JoinedBook *>(self_)](
                                        bool read, const std::vector<ContactNumber> &numbers) {
        if (const auto self = weak.lock()) {
            (*self)->onNumbers(read, numbers);
        }
    });
}

void JoinedBook::onNumbers(bool read, const std::vector<ContactNumber> &numbers)
{
    if (!read) {
        wait_ = backoff_.next();
        again();
        return;
    }
    numbers_ = numbers;
    try {
        const auto wanted = due();
        const int64_t rest = rest_.left(account_.server, context_.timers.steadyMs());
        if (!wanted.empty() && (rest > 0 || !context_.gate.open(account_.server, false))) {
            wait_ = rest > 0 ? rest : hourMs;
            mark();
            return;
        }
        if (wanted.empty()) {
            mark();
            return;
        }
        store_.noteQuestion(context_.timers.epochSeconds(), wanted.size());
        question_ = std::make_unique<JoinedQuestion>(context_.http, context_.timers, account_);
        question_->ask(wanted, [this, asked = wanted.size()](const JoinedFindings &findings) {
            onFindings(asked, findings);
        });
    } catch (const std::exception &fault) {
        g_warning("joined users: the queue fails: %s", fault.what());
        wait_ = backoff_.next();
        again();
    }
}

std::vector<std::string> JoinedBook::due()
{
    std::set<std::string> all;
    for (const ContactNumber &one : numbers_) {
        all.insert(one.e164);
    }
    const int64_t now = context_.timers.epochSeconds();
    const int64_t left = std::max<int64_t>(mostPerDay - store_.askedSince(now - daySeconds), 0);
    // One more than may be asked tells whether something is left.
    auto wanted =
        store_.due(all, account_.server, now - daySeconds + 1, static_cast<size_t>(left) + 1);
    if (wanted.size() > static_cast<size_t>(left)) {
        wanted.resize(static_cast<size_t>(left));
        wait_ = hourMs;
    }
    return wanted;
}

void JoinedBook::onFindings(size_t asked, const JoinedFindings &findings)
{
    const JoinedFindings found = findings;
    question_.reset();
    if (found.asked.size() < asked) {
        wait_ = std::max(backoff_.next(), found.waitSeconds * 1000);
        rest_.begin(found.waitSeconds * 1000, context_.timers.steadyMs());
    } else {
        backoff_.reset();
    }
    try {
        store_.noteAnswers(account_.server, found.asked, found.joined,
                           context_.timers.epochSeconds());
        mark();
    } catch (const std::exception &fault) {
        g_warning("joined users: the queue fails: %s", fault.what());
        wait_ = backoff_.next();
        again();
    }
}

void JoinedBook::mark()
{
    toMark_.clear();
    toUnmark_.clear();
    std::vector<MarkChange> changes;
    const auto answers = store_.answers(account_.server);
    for (const ContactNumber &one : numbers_) {
        const auto found = answers.find(one.e164);
        if (found == answers.end()) {
            continue;
        }
        const auto &[joined, markedBefore] = found->second;
        if (joined) {
            toMark_.insert(one.e164);
        } else if (markedBefore) {
            toUnmark_.insert(one.e164);
        }
        if (one.marked != joined && (joined || markedBefore)) {
            changes.push_back({one.id, joined});
        }
    }
    if (changes.empty()) {
        onMarked(true);
        return;
    }
    g_message("joined users: %zu marks of contacts change", changes.size());
    contacts_.write(changes, [weak = std::weak_ptr<JoinedBook *>(self_)](bool written) {
        if (const auto self = weak.lock()) {
            (*self)->onMarked(written);
        }
    });
}

void JoinedBook::onMarked(bool written)
{
    try {
        if (written) {
            store_.setMarked(toMark_, true);
            store_.setMarked(toUnmark_, false);
        } else {
            wait_ = backoff_.next();
        }
    } catch (const std::exception &fault) {
        g_warning("joined users: the queue fails: %s", fault.what());
        wait_ = backoff_.next();
    }
    again();
}

void JoinedBook::again()
{
    busy_ = false;
    if (changed_) {
        lookSoon();
    } else {
        lookAfter(wait_);
    }
}

} // namespace pelliko::service
