// Obtaining and renewing the credentials that all other operations need. The last out-parameter of
// these operations holds the token or the error message, so it is the call's error message and the
// token's place at once.
#include <cstdlib>
#include <utility>

#include "api/api_call.h"

using namespace quillmere;

const char *get_session_token_uri = "/api/user/get_session_token.php";
const char *get_login_token_uri = "/api/user/get_login_token.php";
const char *renew_session_token_uri = "/api/user/renew_session_token.php";

namespace {

constexpr const char *session_elements[] = {"session_token"};
constexpr const char *login_elements[] = {"pkey", "login_token"};

constexpr auto session_reply = index_of(standard_elements, session_elements);
constexpr auto login_reply = index_of(standard_elements, login_elements);

// SHA-1 of the pieces, joined without separators. The pieces enter unencoded, whatever the URL
// makes of them.
class request_signature {
public:
    template <class... Pieces> explicit request_signature(Pieces... pieces)
    {
        owned_buffer joined(string_new(256));
        (string_append(joined.get(), pieces), ...);
        made_ = simple_sha1(string_get(joined.get()), string_get_size(joined.get()), digits_,
                            sizeof digits_) == 0;
    }

    bool made() const { return made_; }
    const char *digits() const { return digits_; }

private:
    char digits_[41] = "";
    bool made_ = false;
};

} // namespace

int32_t get_session_token(const char *email, const char *password, const char *fb_access_token,
                          const char *application_id, const char *application_key,
                          char **session_token_or_error)
{
    *session_token_or_error = nullptr;
    bool by_password = given(email) && given(password);
    bool by_facebook = !by_password && given(fb_access_token);
    request_signature signature(by_password ? email : nullptr, by_password ? password : nullptr,
                                by_facebook ? fb_access_token : nullptr, application_id,
                                application_key);
    if (!signature.made())
        return QM_SIGNATURE_FAILED;

    api_call call(get_session_token_uri, session_token_or_error);
    call.encoded("?application_id=", application_id);
    if (by_password) {
        call.encoded("&email=", email);
        call.secret("&password=", password);
    } else if (by_facebook) {
        call.secret("&fb_access_token=", fb_access_token);
    }
    call.secret("&signature=", signature.digits());
    call.version();

    call.expect(session_reply);
    call.fetch("Session token url:\n", reply_log::text_and_length);
    if (call.accepted())
        *session_token_or_error = call.required_text_of("session_token").release();
    return call.status();
}

int32_t get_login_token(const char *email, const char *password, const char *application_id,
                        const char *application_key, char **pkey, char **login_token_or_error)
{
    *login_token_or_error = nullptr;
    request_signature signature(email, password, application_id, application_key);
    if (!signature.made())
        return QM_SIGNATURE_FAILED;

    api_call call(get_login_token_uri, login_token_or_error);
    call.encoded("?email=", email);
    call.secret("&password=", password);
    call.encoded("&application_id=", application_id);
    call.secret("&signature=", signature.digits());
    call.version();

    call.expect(login_reply);
    call.fetch("get_login_token url:\n", reply_log::none);
    // Before the result is known, deliberately: a refusal may carry a pkey too.
    if (call.has_reply())
        *pkey = call.text_of("pkey").release();
    if (call.accepted(error_reading::standard, exchange_verdict::silent_unless_zero))
        *login_token_or_error = call.required_text_of("login_token").release();
    if (call.malformed()) {
        // The slot itself is released, deliberately, and not the text it held; it is emptied first,
        // while it is still ours to write to.
        *pkey = nullptr;
        std::free(pkey);
    }
    return call.status();
}

int32_t renew_session_token(const char *session_token, char **session_token_or_error)
{
    api_call call(renew_session_token_uri, session_token_or_error);
    call.plain("?session_token=", session_token);
    call.version();

    call.expect(session_reply);
    call.fetch(nullptr, reply_log::text_and_int_length);
    if (call.accepted(error_reading::standard, exchange_verdict::silent))
        *session_token_or_error = call.required_text_of("session_token").release();
    return call.status();
}
