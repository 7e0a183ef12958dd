// Who is signed in, and what the account may use.

#include "commands.h"

#include "../account.h"
#include "../record_fields.h"

namespace quillmere::tools {

namespace {

// The storage figures stand among the limits, too; people need to see them once.
constexpr record_field<user_info> user_fields[] = {
    {"email", "E-mail", user_info_get_email},
    {"display_name", "Name", user_info_get_display_name},
    {"first_name", "First name", user_info_get_first_name},
    {"last_name", "Last name", user_info_get_last_name},
    {"gender", "Gender", user_info_get_gender},
    {"birth_date", "Birth date", user_info_get_birthdate},
    {"location", "Location", user_info_get_location},
    {"website", "Website", user_info_get_website},
    {"created", "Member since", user_info_get_created},
    {"premium", "Premium", user_info_get_premium},
    {"validated", "Validated", user_info_get_validated},
    {"tos_accepted", "Terms accepted", user_info_get_tos_accepted},
    {"options", "Options", user_info_get_options},
    {"bandwidth", "Bandwidth left", user_info_get_bandwidth, field_value::number},
    {"max_upload_size", "Largest upload", user_info_get_max_upload, field_value::number},
    {"max_instant_upload_size", "Largest instant upload", user_info_get_max_instant_upload,
     field_value::number},
    {"base_storage", nullptr, user_info_get_base_storage, field_value::number},
    {"bonus_storage", nullptr, user_info_get_bonus_storage, field_value::number},
    {"storage_limit", nullptr, user_info_get_storage_limit, field_value::number},
    {"used_storage_size", nullptr, user_info_get_used_storage, field_value::number},
    {"storage_limit_exceeded", "Storage exceeded", user_info_get_storage_limit_exceeded},
};

constexpr record_field<user_info> facebook_fields[] = {
    {"linked", "Facebook linked", user_info_get_fb_linked},
    {"facebook_id", "Facebook id", user_info_get_fb_facebook_id},
    {"date_created", "Facebook since", user_info_get_fb_date_created},
    {"email", "Facebook e-mail", user_info_get_fb_email},
    {"facebook_url", "Facebook address", user_info_get_fb_facebook_url},
    {"name", "Facebook name", user_info_get_fb_name},
    {"firstname", "Facebook first name", user_info_get_fb_firstname},
    {"lastname", "Facebook last name", user_info_get_fb_lastname},
    {"hometown", "Facebook home town", user_info_get_fb_hometown},
    {"location", "Facebook location", user_info_get_fb_location},
    {"i18n", "Facebook language", user_info_get_fb_i18n},
    {"timezone", "Facebook time zone", user_info_get_fb_timezone},
};

constexpr record_field<user_info> twitter_fields[] = {
    {"linked", "Twitter linked", user_info_get_tw_linked},
    {"twitter_id", "Twitter id", user_info_get_tw_twitter_id},
    {"date_created", "Twitter since", user_info_get_tw_date_created},
    {"screen_name", "Twitter screen name", user_info_get_tw_screen_name},
    {"name", "Twitter name", user_info_get_tw_name},
    {"i18n", "Twitter language", user_info_get_tw_i18n},
};

constexpr record_field<user_limits> account_limit_fields[] = {
    {"storage_base", "Storage, base", user_limits_get_storage_base, field_value::number},
    {"storage_bonus", "Storage, bonus", user_limits_get_storage_bonus, field_value::number},
    {"storage_limit", "Storage limit", user_limits_get_storage_limit, field_value::number},
    {"storage_used", "Storage used", user_limits_get_storage_used, field_value::number},
    {"bandwidth_limit", "Bandwidth limit", user_limits_get_bandwidth_limit, field_value::number},
    {"bandwidth_used", "Bandwidth used", user_limits_get_bandwidth_used, field_value::number},
    {"collaboration_limit", "Shares a day", user_limits_get_collaboration_limit,
     field_value::number},
    {"collaboration_today", "Shares today", user_limits_get_collaboration_today,
     field_value::number},
    {"one_time_downloads_limit", "One-time downloads a day",
     user_limits_get_one_time_downloads_limit, field_value::number},
    {"one_time_downloads_today", "One-time downloads today",
     user_limits_get_one_time_downloads_today, field_value::number},
    {"streaming_bandwidth_limit", "Streaming a day", user_limits_get_streaming_bandwidth_limit,
     field_value::number},
    {"streaming_bandwidth_today", "Streaming today", user_limits_get_streaming_bandwidth_today,
     field_value::number},
    {"upload_size_limit", "Upload size limit", user_limits_get_upload_size_limit,
     field_value::number},
};

user_info_owner read_user(const account &owner)
{
    user_info *record = nullptr;
    owner.remote.read("reading the account", [&](char **error_message) {
        return get_user_info(owner.session(), &record, error_message);
    });
    return user_info_owner(record);
}

user_limits_owner read_limits(const account &owner)
{
    user_limits *record = nullptr;
    owner.remote.read("reading the account's limits", [&](char **error_message) {
        return get_user_limits(owner.session(), &record, error_message);
    });
    return user_limits_owner(record);
}

std::vector<fact> read_revision(const account &owner)
{
    char *revision = nullptr;
    char *epoch = nullptr;
    owner.remote.read("reading the account's revision", [&](char **error_message) {
        return get_myfiles_revision(owner.session(), &revision, &epoch, error_message);
    });
    const heap_text owned_revision(revision);
    const heap_text owned_epoch(epoch);
    return {{"revision", "Revision", number_or_text(revision)},
            {"epoch", "Epoch", number_or_text(epoch)}};
}

} // namespace

void run_whoami(command_context &context)
{
    const account owner = signed_in_account(context);
    const user_info_owner user = read_user(owner);
    const user_limits_owner limits = read_limits(owner);
    context.output.groups({{"user", facts_of(user.get(), user_fields)},
                           {"facebook", facts_of(user.get(), facebook_fields)},
                           {"twitter", facts_of(user.get(), twitter_fields)},
                           {"limits", facts_of(limits.get(), account_limit_fields)},
                           {"tree", read_revision(owner)}});
}

} // namespace quillmere::tools
