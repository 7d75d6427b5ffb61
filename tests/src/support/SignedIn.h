#pragma once

#include <gtest/gtest.h>
#include <kor_account.h>
#include <string>

namespace pelliko::test
{

/// While it lives, the user of this world has an account. No server knows it: for worlds without
/// one.
class SignedIn
{
public:
    explicit SignedIn(const std::string &imsi = "234150000900100")
    {
        EXPECT_EQ(korrin::writeAccount(korrin::defaultAccountFile(),
                                       {"http://127.0.0.1:9", "+447700900100", "token", imsi}),
                  "");
    }
    ~SignedIn() { signOut(); }
    SignedIn(const SignedIn &) = delete;
    SignedIn &operator=(const SignedIn &) = delete;

    void signOut() { EXPECT_EQ(korrin::removeAccount(korrin::defaultAccountFile()), ""); }
};

} // namespace pelliko::test
