#include "support/globals_guard.h"

#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <iterator>

namespace quillmere_test {
namespace {

// Every path variable of the header, one to a line.
// clang-format off
const char **const uris[] = {
    &get_session_token_uri,
    &get_login_token_uri,
    &renew_session_token_uri,
    &get_system_limits_uri,
    &get_system_status_uri,
    &get_device_status_uri,
    &get_user_info_uri,
    &get_user_limits_uri,
    &myfiles_revision_uri,
    &get_folder_info_uri,
    &create_folder_uri,
    &delete_folder_uri,
    &update_folder_uri,
    &copy_folder_uri,
    &move_folder_uri,
    &get_folder_content_uri,
    &attach_foreign_uri,
    &detach_foreign_uri,
    &get_file_info_uri,
    &create_file_uri,
    &delete_file_uri,
    &copy_file_uri,
    &move_file_uri,
    &get_links_uri,
    &get_download_link_uri,
    &get_device_changes_uri,
    &update_file_uri,
};
// clang-format on

optional_text copy_of(const char *text) { return text ? optional_text(text) : std::nullopt; }

void put_environment(const std::string &name, const optional_text &value)
{
    if (value)
        ::setenv(name.c_str(), value->c_str(), 1);
    else
        ::unsetenv(name.c_str());
}

} // namespace

void replace_owned_text(char *&owned, const optional_text &text)
{
    api_free(owned);
    owned = text ? ::strdup(text->c_str()) : nullptr;
}

globals_guard::globals_guard()
    : api_version_(api_version), check_api_error_(check_api_error), ssl_disabled_(ssl_disabled),
      debug_replace_(debug_replace_get_response_from_url),
      output_file_(output_file), proxy_{proxy_server.enabled, copy_of(proxy_server.host),
                                        copy_of(proxy_server.user), copy_of(proxy_server.password),
                                        proxy_server.port},
      ca_path_(copy_of(ca_cert_pem_path.path)), default_timeout_(ca_cert_pem_path.default_timeout),
      connection_attempts_(ca_cert_pem_path.connection_attempts)
{
    std::copy(std::begin(urls), std::end(urls), urls_);
    for (const char **uri : uris)
        uris_.push_back(*uri);
}

globals_guard::~globals_guard()
{
    std::copy(std::begin(urls_), std::end(urls_), urls);
    for (size_t i = 0; i < uris_.size(); ++i)
        *uris[i] = uris_[i];
    api_version = api_version_;
    check_api_error = check_api_error_;
    ssl_disabled = ssl_disabled_;
    debug_replace_get_response_from_url = debug_replace_;
    output_file = output_file_;
    ca_cert_pem_path.default_timeout = default_timeout_;
    ca_cert_pem_path.connection_attempts = connection_attempts_;
    replace_owned_text(ca_cert_pem_path.path, ca_path_);
    restore_proxy();
    set_response_limit(0);
    set_connection_reuse(0);
}

void globals_guard::restore_proxy() const
{
    replace_owned_text(proxy_server.host, proxy_.host);
    replace_owned_text(proxy_server.user, proxy_.user);
    replace_owned_text(proxy_server.password, proxy_.password);
    proxy_server.enabled = proxy_.enabled;
    proxy_server.port = proxy_.port;
}

environment_guard::~environment_guard()
{
    for (const auto &[name, value] : before_)
        put_environment(name, value);
}

void environment_guard::set(const std::string &name, const std::string &value)
{
    save(name);
    put_environment(name, value);
}

void environment_guard::unset(const std::string &name)
{
    save(name);
    put_environment(name, std::nullopt);
}

void environment_guard::save(const std::string &name)
{
    // Only the first change of a name still sees what was there before.
    before_.emplace(name, copy_of(::getenv(name.c_str())));
}

} // namespace quillmere_test
