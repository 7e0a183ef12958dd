// What the service knows of the account that is logged in.
#include "api/api_call.h"

using namespace quillmere;

const char *get_user_info_uri = "/api/user/get_info.php";
const char *get_user_limits_uri = "/api/user/get_limits.php";
const char *myfiles_revision_uri = "/api/user/myfiles_revision.php";

namespace {

constexpr element_field<user_info> profile_elements[] = {
    {"/user_info/email", &user_info::email},
    {"/user_info/first_name", &user_info::first_name},
    {"/user_info/last_name", &user_info::last_name},
    {"/user_info/display_name", &user_info::display_name},
    {"/user_info/gender", &user_info::gender},
    {"/user_info/birth_date", &user_info::birthdate},
    {"/user_info/location", &user_info::location},
    {"/user_info/website", &user_info::website},
    {"/user_info/premium", &user_info::premium},
    {"/user_info/bandwidth", &user_info::bandwidth},
    {"/user_info/created", &user_info::created},
    {"/user_info/max_upload_size", &user_info::max_upload},
    {"/user_info/max_instant_upload_size", &user_info::max_instant_upload},
    {"/user_info/validated", &user_info::validated},
    {"/user_info/tos_accepted", &user_info::tos_accepted},
    {"/user_info/used_storage_size", &user_info::used_storage},
    {"/user_info/base_storage", &user_info::base_storage},
    {"/user_info/bonus_storage", &user_info::bonus_storage},
    {"/user_info/storage_limit", &user_info::storage_limit},
    {"/user_info/storage_limit_exceeded", &user_info::storage_limit_exceeded},
    {"/user_info/options", &user_info::options},
    {"/user_info/facebook/linked", &user_info::fb_linked},
};

constexpr element_field<user_info> facebook_elements[] = {
    {"/user_info/facebook/facebook_id", &user_info::fb_facebook_id},
    {"/user_info/facebook/date_created", &user_info::fb_date_created},
    {"/user_info/facebook/email", &user_info::fb_email},
    {"/user_info/facebook/facebook_url", &user_info::fb_facebook_url},
    {"/user_info/facebook/name", &user_info::fb_name},
    {"/user_info/facebook/firstname", &user_info::fb_firstname},
    {"/user_info/facebook/lastname", &user_info::fb_lastname},
    {"/user_info/facebook/hometown", &user_info::fb_hometown},
    {"/user_info/facebook/location", &user_info::fb_location},
    {"/user_info/facebook/i18n", &user_info::fb_i18n},
    {"/user_info/facebook/timezone", &user_info::fb_timezone},
};

constexpr element_field<user_info> twitter_link_elements[] = {
    {"/user_info/twitter/linked", &user_info::tw_linked},
};

constexpr element_field<user_info> twitter_elements[] = {
    {"/user_info/twitter/twitter_id", &user_info::tw_twitter_id},
    {"/user_info/twitter/date_created", &user_info::tw_date_created},
    {"/user_info/twitter/screen_name", &user_info::tw_screen_name},
    {"/user_info/twitter/name", &user_info::tw_name},
    {"/user_info/twitter/i18n", &user_info::tw_i18n},
};

constexpr element_field<user_limits> limits_elements[] = {
    {"storage_base", &user_limits::storage_base},
    {"storage_bonus", &user_limits::storage_bonus},
    {"storage_limit", &user_limits::storage_limit},
    {"storage_used", &user_limits::storage_used},
    {"bandwidth_limit", &user_limits::bandwidth_limit},
    {"bandwidth_used", &user_limits::bandwidth_used},
    {"collaboration_limit", &user_limits::collaboration_limit},
    {"collaboration_today", &user_limits::collaboration_today},
    {"one_time_downloads_limit", &user_limits::one_time_downloads_limit},
    {"one_time_downloads_today", &user_limits::one_time_downloads_today},
    {"streaming_bandwidth_limit", &user_limits::streaming_bandwidth_limit},
    {"streaming_bandwidth_today", &user_limits::streaming_bandwidth_today},
    {"upload_size_limit", &user_limits::upload_size_limit},
};

constexpr const char *revision_elements[] = {"revision", "epoch"};

// The details of a linked account may be asked for, so they are expected.
constexpr auto user_reply = index_of(standard_elements, profile_elements, facebook_elements,
                                     twitter_link_elements, twitter_elements);
constexpr auto limits_reply = index_of(standard_elements, limits_elements);
constexpr auto revision_reply = index_of(standard_elements, revision_elements);

// The details of a social account are only looked up when it is linked: the service may send
// leftovers of one that was.
owned_record<user_info> user_info_of(api_call &call)
{
    auto info = new_record<user_info>();
    call.fill(*info, profile_elements);
    if (is_yes(info->fb_linked))
        call.fill(*info, facebook_elements);
    call.fill(*info, twitter_link_elements);
    if (is_yes(info->tw_linked))
        call.fill(*info, twitter_elements);
    return call.malformed() ? nullptr : std::move(info);
}

} // namespace

int32_t get_user_info(const char *session_token, user_info **info, char **error_message)
{
    *info = nullptr;
    api_call call(get_user_info_uri, error_message);
    call.plain("?session_token=", session_token);
    call.version();

    call.expect(user_reply);
    call.fetch("get user  url: ", reply_log::text); // two blanks, deliberately
    if (call.accepted())
        *info = user_info_of(call).release();
    return call.status();
}

int32_t get_user_limits(const char *session_token, user_limits **limits, char **error_message)
{
    *limits = nullptr;
    api_call call(get_user_limits_uri, error_message);
    call.plain("?session_token=", session_token);
    call.version();

    call.expect(limits_reply);
    call.fetch("get user limits url: ", reply_log::text);
    if (call.accepted())
        *limits = call.record_of(limits_elements).release();
    return call.status();
}

int32_t get_myfiles_revision(const char *session_token, char **revision, char **epoch,
                             char **error_message)
{
    *revision = nullptr;
    *epoch = nullptr;
    api_call call(myfiles_revision_uri, error_message);
    call.plain("?session_token=", session_token);
    call.version();

    call.expect(revision_reply);
    call.fetch(nullptr, reply_log::none);
    if (call.accepted(error_reading::standard, exchange_verdict::silent_unless_zero)) {
        *revision = call.text_of("revision").release();
        *epoch = call.text_of("epoch").release();
        if (!*revision && !*epoch)
            call.reply_is_unusable();
    }
    if (call.malformed()) {
        discard(revision);
        discard(epoch);
    }
    return call.status();
}
