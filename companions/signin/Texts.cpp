#include "Texts.h"

#include "Language.h"

#include <algorithm>
#include <array>

namespace pelliko::signin
{
namespace
{

using companion::mark;
using companion::translated;

struct Sentence {
    const char *failure;
    const char *text;
};

constexpr std::array sentences{
    Sentence{"server_missing", mark("Enter the address of your share server.")},
    Sentence{"server_invalid", mark("This is not the address of a server.")},
    Sentence{"insecure",
             mark("The address has to begin with https://, so that nobody can read along.")},
    Sentence{"code_missing", mark("Enter the invitation code that you were given.")},
    Sentence{"number_invalid",
             mark("This is not a valid phone number. Enter it with the country code, like "
                  "+44 7700 900123.")},
    Sentence{"unreachable",
             mark("The server cannot be reached. Check its address and your connection.")},
    Sentence{"timeout", mark("The server does not answer. Try again later.")},
    Sentence{"certificate", mark("The server's certificate is wrong, so it may not be the server "
                                 "that you mean. Nothing was sent.")},
    Sentence{"unexpected_answer",
             mark("Something answers at this address, but it is no share server.")},
    Sentence{"not_found", mark("Something answers at this address, but it is no share server.")},
    Sentence{"code_unknown", mark("The server does not know this invitation code.")},
    Sentence{"code_used_up", mark("This invitation code has been used up. Ask for a new one.")},
    Sentence{"code_expired", mark("This invitation code has expired. Ask for a new one.")},
    Sentence{"code_for_other_number", mark("This invitation code is for another phone number.")},
    Sentence{"number_taken", mark("This phone number has an account already. To use it on this "
                                  "phone, ask for a code that renews it.")},
    Sentence{"cannot_store", mark("The account could not be stored on this phone. Make room and "
                                  "try again: the code still works for you.")},
    Sentence{"no_space", mark("The server has no room. Try again later.")},
    Sentence{"internal", mark("The server failed. Try again later.")},
};

} // namespace

std::string failureText(const std::string &failure, long long retryAfterSeconds)
{
    if (failure == "too_many_attempts") {
        constexpr long long minute = 60;
        const long long minutes = std::max(1LL, (retryAfterSeconds + minute - 1) / minute);
        std::string text = translated("There were too many attempts. Try again in %d minutes.");
        if (const auto place = text.find("%d"); place != std::string::npos)
            text.replace(place, 2, std::to_string(minutes));
        return text;
    }
    const auto *found = std::find_if(sentences.begin(), sentences.end(),
                                     [&](const Sentence &s) { return failure == s.failure; });
    return found == sentences.end() ? translated("The server refused. Try again later.")
                                    : translated(found->text);
}

} // namespace pelliko::signin
