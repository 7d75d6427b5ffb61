#include "CurlPost.h"
#include "kor_account.h"
#include "kor_registration.h"

#include <gio/gio.h>
#include <nlohmann/json.hpp>

#include <atomic>
#include <cstring>
#include <thread>

namespace pelliko::korrin
{
namespace
{

constexpr int created = 201;

// The same attempt from the same phone has the same name, and nobody else can guess it.
std::string attemptName(const RegistrationWish &wish)
{
    g_autofree char *machine = nullptr;
    gsize length = 0;
    if (!g_file_get_contents("/etc/machine-id", &machine, &length, nullptr))
        machine = g_strdup(g_get_host_name());
    const std::string attempt = wish.code + "\n" + wish.number;
    g_autofree char *name = g_compute_hmac_for_string(
        G_CHECKSUM_SHA256, reinterpret_cast<const guchar *>(machine), strlen(machine),
        attempt.data(), static_cast<gssize>(attempt.size()));
    return name;
}

std::string textOf(const nlohmann::json &body, const char *member)
{
    if (!body.is_object())
        return {};
    const auto found = body.find(member);
    return found != body.end() && found->is_string() ? found->get<std::string>() : std::string();
}

RegistrationResult resultOf(const RegistrationWish &wish, const PostAnswer &answer)
{
    if (!answer.failure.empty())
        return {answer.failure, {}, 0};
    const auto body = nlohmann::json::parse(answer.body, nullptr, false);
    if (answer.status == created) {
        const std::string token = textOf(body, "token");
        if (accountFault({wish.server, wish.number, token}).empty() &&
            textOf(body, "number") == wish.number)
            return {{}, token, 0};
        return {"unexpected_answer", {}, 0};
    }
    const std::string name = textOf(body, "error");
    return {answer.status >= 400 && !name.empty() ? name : "unexpected_answer",
            {},
            answer.retryAfterSeconds};
}

} // namespace

struct Registration::Attempt {
    RegistrationWish wish;
    Done done;
    Registration *owner = nullptr; // main loop only; null once cancelled
    std::atomic<bool> cancelled{false};
    RegistrationResult result;

    void ask()
    {
        const nlohmann::json body{{"number", wish.number}, {"code", wish.code}};
        const PostAnswer answer = postJson(
            wish.server + "/api/v1/accounts",
            {"Content-Type: application/json", "Accept: application/json",
             "Expect:", "Idempotency-Key: " + attemptName(wish)},
            body.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace), cancelled);
        result = resultOf(wish, answer);
    }
};

Registration::~Registration()
{
    cancel();
}

// On the main loop; owns one reference to the attempt.
int Registration::finish(void *data)
{
    const std::unique_ptr<std::shared_ptr<Attempt>> held(
        static_cast<std::shared_ptr<Attempt> *>(data));
    const std::shared_ptr<Attempt> attempt = *held;
    if (attempt->owner) {
        attempt->owner->attempt_.reset();
        attempt->done(attempt->result);
    }
    return G_SOURCE_REMOVE;
}

void Registration::start(const RegistrationWish &wish, Done done)
{
    cancel();
    attempt_ = std::make_shared<Attempt>();
    attempt_->wish = wish;
    attempt_->done = std::move(done);
    attempt_->owner = this;
    // The thread may outlive this object: it has a share of the attempt and nothing else.
    std::thread([attempt = attempt_] {
        attempt->ask();
        g_idle_add(finish, new std::shared_ptr<Attempt>(attempt));
    }).detach();
}

void Registration::cancel()
{
    if (!attempt_)
        return;
    attempt_->owner = nullptr;
    attempt_->cancelled = true;
    attempt_.reset();
}

std::string withScheme(const std::string &address)
{
    return address.empty() || address.find("://") != std::string::npos ? address
                                                                       : "https://" + address;
}

bool isSafeAddress(const std::string &address)
{
    g_autoptr(GUri) uri = g_uri_parse(address.c_str(), G_URI_FLAGS_NONE, nullptr);
    if (!uri || !g_uri_get_host(uri) || !*g_uri_get_host(uri))
        return false;
    const char *scheme = g_uri_get_scheme(uri);
    if (g_str_equal(scheme, "https"))
        return true;
    g_autoptr(GInetAddress) host = g_inet_address_new_from_string(g_uri_get_host(uri));
    const bool own = g_str_equal(g_uri_get_host(uri), "localhost") ||
                     (host && g_inet_address_get_is_loopback(host));
    return g_str_equal(scheme, "http") && own;
}

} // namespace pelliko::korrin
