#include "router.h"

#include <algorithm>

#include "caller.h"
#include "endpoints/endpoints.h"
#include "envelope.h"
#include "links.h"
#include "store/database.h"

namespace emulator {
namespace {

const endpoint *find_endpoint(std::string_view path)
{
    const std::vector<endpoint> &table = endpoint_table();
    const auto found = std::find_if(table.begin(), table.end(),
                                    [path](const endpoint &row) { return path == row.path; });
    return found == table.end() ? nullptr : &*found;
}

// "/api/device/get_status.php" is the action "device/get_status", and so it is with a version
// ahead of it.
std::string_view action_of(const endpoint &target)
{
    constexpr std::string_view beginning = "/api/";
    constexpr std::string_view version = "1.0/";
    std::string_view path = target.path;
    path.remove_prefix(beginning.size());
    if (path.substr(0, version.size()) == version)
        path.remove_prefix(version.size());
    return path.substr(0, path.rfind('.'));
}

bool is_form(std::string_view content_type)
{
    constexpr std::string_view form = "application/x-www-form-urlencoded";
    return content_type.substr(0, content_type.find(';')) == form;
}

parameters parameters_of(const request &asked, std::string_view query)
{
    parameters given;
    add_form_parameters(query, given);
    if (asked.body.empty())
        return given;
    if (!is_form(asked.content_type))
        throw refusal(error::body_type_unsupported);
    add_form_parameters(asked.body, given);
    return given;
}

void handle(const endpoint &target, const call &made, xml_writer &xml)
{
    if (target.use == store_use::own)
        return target.handle(made, xml);
    transaction whole(made.state.store, target.use == store_use::changes ? transaction_kind::writes
                                                                         : transaction_kind::reads);
    target.handle(made, xml);
    whole.commit();
}

reply run(const request &asked, std::string_view query, const endpoint &target, service &state)
{
    const parameters given = parameters_of(asked, query);
    const call made{state, given, account_of_session(given, target.session, state), asked.origin};
    xml_writer xml;
    begin_envelope(xml, action_of(target));
    handle(target, made, xml);
    return {200, end_envelope(xml, "Success")};
}

void check_method(const std::string &method)
{
    if (method != "GET" && method != "POST" && method != "HEAD")
        throw refusal(error::method_not_allowed);
}

} // namespace

const std::vector<endpoint> &endpoint_table()
{
    using need = session_need;
    using use = store_use;
    static const std::vector<endpoint> table = {
        {"/api/user/get_session_token.php", need::none, use::own, get_session_token},
        {"/api/user/get_login_token.php", need::none, use::own, get_login_token},
        // Its session is looked up in the same transaction that ends it.
        {"/api/user/renew_session_token.php", need::none, use::own, renew_session_token},
        {"/api/user/get_info.php", need::required, use::reads, get_user_info},
        {"/api/user/get_limits.php", need::required, use::reads, get_user_limits},
        {"/api/user/myfiles_revision.php", need::required, use::reads, get_myfiles_revision},
        {"/api/system/get_limits.php", need::none, use::own, get_system_limits},
        {"/api/system/get_status.php", need::none, use::own, get_system_status},
        {"/api/device/get_status.php", need::required, use::reads, get_device_status},
        {"/api/device/get_changes.php", need::required, use::reads, get_device_changes},
        {"/api/folder/get_info.php", need::optional, use::reads, get_folder_info},
        {"/api/folder/create.php", need::required, use::changes, create_folder},
        {"/api/folder/delete.php", need::required, use::changes, delete_folder},
        {"/api/folder/update.php", need::required, use::changes, update_folder},
        {"/api/folder/copy.php", need::required, use::changes, copy_folder},
        {"/api/folder/move.php", need::required, use::changes, move_folder},
        {"/api/1.0/folder/get_content.php", need::optional, use::reads, get_folder_content},
        {"/api/folder/attach_foreign.php", need::required, use::changes, attach_foreign_folder},
        {"/api/folder/detach_foreign.php", need::required, use::changes, detach_foreign_folder},
        {"/api/file/get_info.php", need::optional, use::reads, get_file_info},
        {"/api/file/create.php", need::required, use::changes, create_file},
        {"/api/file/delete.php", need::required, use::changes, delete_file},
        {"/api/file/update.php", need::required, use::changes, update_file},
        {"/api/file/copy.php", need::required, use::changes, copy_file},
        {"/api/file/move.php", need::required, use::changes, move_file},
        {"/api/file/get_links.php", need::optional, use::changes, get_file_links},
    };
    return table;
}

bool is_endpoint(std::string_view path) { return find_endpoint(path) != nullptr; }

reply answer(const request &asked, service &state)
{
    const split_target parts = split(asked.target);
    const endpoint *target = find_endpoint(parts.path);
    const std::string_view action = target ? action_of(*target) : std::string_view();
    reply made{};
    const auto refused = refusal_of(parts.path, action, [&] {
        const link_kind *kind = link_kind_of(parts.path);
        if (!kind && !target)
            throw refusal(error::unknown_endpoint);
        if (!kind)
            check_method(asked.method);
        made = kind ? serve_link(asked, *kind, state) : run(asked, parts.query, *target, state);
    });
    return refused ? *refused : made;
}

const std::string &call::required(const char *name) const
{
    const std::string &text = optional(name);
    if (text.empty())
        throw refusal(error::parameter_missing, name);
    return text;
}

const std::string &call::optional(const char *name) const
{
    static const std::string missing;
    const auto found = given.find(name);
    return found == given.end() ? missing : found->second;
}

} // namespace emulator
