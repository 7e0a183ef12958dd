// Authentication: who asks, on behalf of which application, and whether the signature proves it.
#include "digest.h"
#include "endpoints/endpoints.h"
#include "errors.h"
#include "store/accounts.h"
#include "store/applications.h"
#include "store/sessions.h"

namespace emulator {
namespace {

constexpr std::int64_t login_token_lifetime = 600;

session_time session_time_of(const call &asked)
{
    return {asked.state.now(), asked.state.session_lifetime};
}

// The key of the application is the one part of the signed text that is never sent.
void check_signature(const call &asked, const std::string &credentials)
{
    const std::string &application_id = asked.required("application_id");
    const std::string &signature = asked.required("signature");
    const auto key = find_application_key(asked.state.store, application_id);
    if (!key)
        throw refusal(error::application_unknown);
    if (!equal_secrets(signature, sha1_hex(credentials + application_id + *key)))
        throw refusal(error::signature_wrong);
}

std::int64_t known_account(const std::optional<std::int64_t> &account)
{
    if (!account)
        throw refusal(error::credentials_wrong);
    return *account;
}

std::int64_t sign_in_with_password(const call &asked)
{
    const std::string &email = asked.required("email");
    const std::string &password = asked.required("password");
    check_signature(asked, email + password);
    return known_account(authenticate(asked.state.store, email, password));
}

std::int64_t sign_in_with_facebook(const call &asked)
{
    const std::string &token = asked.required("fb_access_token");
    check_signature(asked, token);
    return known_account(authenticate_facebook(asked.state.store, token));
}

// Address and password count when both are there, as they do for the client's signature.
bool brings_password(const call &asked)
{
    return !asked.optional("email").empty() && !asked.optional("password").empty();
}

} // namespace

void get_session_token(const call &asked, xml_writer &xml)
{
    const bool facebook = !brings_password(asked) && !asked.optional("fb_access_token").empty();
    const std::int64_t account =
        facebook ? sign_in_with_facebook(asked) : sign_in_with_password(asked);
    xml.element("session_token", open_session(asked.state.store, account, session_time_of(asked)));
    xml.element("pkey", account_pkey(asked.state.store, account));
}

void get_login_token(const call &asked, xml_writer &xml)
{
    const std::int64_t account = sign_in_with_password(asked);
    xml.element("login_token", make_login_token(asked.state.store, account,
                                                {asked.state.now(), login_token_lifetime}));
    xml.element("pkey", account_pkey(asked.state.store, account));
}

void renew_session_token(const call &asked, xml_writer &xml)
{
    const auto renewed =
        renew_session(asked.state.store, asked.optional("session_token"), session_time_of(asked));
    if (!renewed)
        throw refusal(error::session_invalid);
    xml.element("session_token", *renewed);
}

} // namespace emulator
