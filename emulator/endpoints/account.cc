// What an account is told of itself.
#include "endpoints/endpoints.h"
#include "store/accounts.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/profiles.h"
#include "store/usage.h"
#include "times.h"

namespace emulator {
namespace {

std::string value_of(const profile &of, const std::string &name, const char *unset)
{
    const auto found = of.find(name);
    return found == of.end() ? unset : found->second;
}

template <std::size_t Count>
void write_fields(const profile_field (&fields)[Count], const profile &of,
                  const std::string &beginning, xml_writer &xml)
{
    for (const profile_field &each : fields)
        xml.element(each.name, value_of(of, beginning + each.name, each.unset));
}

template <std::size_t Count>
void write_social(const char *name, bool is_linked, const profile_field (&fields)[Count],
                  const profile &of, xml_writer &xml)
{
    xml.open(name);
    xml.element("linked", is_linked ? "yes" : "no");
    if (is_linked)
        write_fields(fields, of, std::string(name) + "/", xml);
    xml.close();
}

void write_usage(const account_usage &usage, xml_writer &xml)
{
    xml.element("bandwidth", usage.bandwidth_left());
    xml.element("max_upload_size", upload_size_limit);
    xml.element("max_instant_upload_size", upload_size_limit);
    xml.element("used_storage_size", usage.used_storage);
    xml.element("base_storage", usage.base_storage);
    xml.element("bonus_storage", usage.bonus_storage);
    xml.element("storage_limit", usage.storage_limit());
    xml.element("storage_limit_exceeded", usage.is_storage_exceeded() ? "yes" : "no");
}

} // namespace

void get_user_info(const call &asked, xml_writer &xml)
{
    database &store = asked.state.store;
    const profile of = profile_of(store, asked.account);
    xml.open("user_info");
    xml.element("email", account_email(store, asked.account));
    xml.element("display_name", owner_name(store, asked.account));
    xml.element("created", date_text(account_created(store, asked.account)));
    write_fields(own_fields, of, "", xml);
    write_usage(usage_of(store, asked.account, asked.state.now()), xml);
    write_social("facebook", is_facebook_linked(store, asked.account, of), facebook_fields, of,
                 xml);
    write_social("twitter", is_twitter_linked(of), twitter_fields, of, xml);
    xml.close();
}

void get_user_limits(const call &asked, xml_writer &xml)
{
    database &store = asked.state.store;
    const std::int64_t now = asked.state.now();
    const account_usage usage = usage_of(store, asked.account, now);
    xml.element("storage_base", usage.base_storage);
    xml.element("storage_bonus", usage.bonus_storage);
    xml.element("storage_limit", usage.storage_limit());
    xml.element("storage_used", usage.used_storage);
    xml.element("bandwidth_limit", usage.bandwidth_limit);
    xml.element("bandwidth_used", usage.bandwidth_used);
    xml.element("collaboration_limit", collaboration_limit);
    xml.element("collaboration_today", attached_today(store, asked.account, now));
    xml.element("one_time_downloads_limit", one_time_download_limit);
    xml.element("one_time_downloads_today", usage.one_time_today);
    xml.element("streaming_bandwidth_limit", streaming_limit);
    xml.element("streaming_bandwidth_today", usage.streamed_today);
    xml.element("upload_size_limit", upload_size_limit);
}

void get_myfiles_revision(const call &asked, xml_writer &xml)
{
    xml.element("revision", account_revision(asked.state.store, asked.account));
    xml.element("epoch", account_epoch(asked.state.store, asked.account));
}

} // namespace emulator
