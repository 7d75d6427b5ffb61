// Keeps the address book of joined users up to date
#pragma once

#include "Backoff.h"
#include "ContactMarks.h"
#include "JoinedNumbers.h"
#include "JoinedQuestion.h"
#include "RequestContext.h"
#include "ServerRest.h"

namespace pelliko::service
{

/**
 * Asks the server which of the contacts' numbers have joined and marks them in the contacts store:
 * new ones soon, all once a day. Asks for half of what the server allows at most; the other half is
 * for shares. A mark that somebody else has made is left alone.
 */
class JoinedBook
{
public:
    JoinedBook(RequestContext &context, UploadQueue &queue, ContactMarks &contacts);
    ~JoinedBook();
    JoinedBook(const JoinedBook &) = delete;
    JoinedBook &operator=(const JoinedBook &) = delete;

    /** The contacts or the account may have changed. */
    void lookSoon();
    /** There may be a network to do over what was not possible. */
    void networkChanged();

private:
    void look();
    void onNumbers(bool read, const std::vector<ContactNumber> &numbers);
    std::vector<std::string> due();
    void onFindings(size_t asked, const JoinedFindings &findings);
    void mark();
    void onMarked(bool written);
    void lookAfter(int64_t milliseconds);
    void again();

    RequestContext &context_;
    JoinedNumbers store_;
    ContactMarks &contacts_;
    Backoff backoff_;
    ServerRest rest_;
    Account account_;
    std::vector<ContactNumber> numbers_;
    std::set<std::string> toMark_;
    std::set<std::string> toUnmark_;
    std::unique_ptr<JoinedQuestion> question_;
    int64_t wait_ = 0; ///< until the next look, in milliseconds
    uint64_t timer_ = 0;
    bool busy_ = false;
    bool soon_ = false;    ///< a look is near
    bool changed_ = false; ///< something changed while it was busy
    std::shared_ptr<JoinedBook *> self_;
};

} // namespace pelliko::service
