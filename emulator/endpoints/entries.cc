#include "endpoints/entries.h"

#include <limits>

#include "errors.h"
#include "store/attachments.h"
#include "store/database.h"
#include "store/names.h"
#include "text.h"
#include "times.h"

namespace emulator {
namespace {

folder root_of_account(const call &asked)
{
    if (asked.account == 0)
        throw refusal(error::session_invalid);
    return root_of(asked.state.store, asked.account);
}

folder any_folder(const call &asked, const std::string &key)
{
    const std::optional<folder> found = find_folder(asked.state.store, key);
    if (!found || (found->deleted != 0 && found->account != asked.account))
        throw refusal(error::folder_unknown);
    return *found;
}

file any_file(const call &asked, const std::string &key)
{
    const std::optional<file> found = find_file(asked.state.store, key);
    if (!found || (found->deleted != 0 && found->account != asked.account))
        throw refusal(error::file_unknown);
    return *found;
}

template <class Entry> Entry living(Entry entry, error otherwise)
{
    if (entry.deleted != 0)
        throw refusal(otherwise);
    return entry;
}

template <class Entry> void check_owner(const call &asked, const Entry &entry)
{
    if (entry.account != asked.account)
        throw refusal(error::access_denied);
}

std::string text_given(const call &asked, const char *parameter)
{
    constexpr std::size_t longest_text = 4096;
    const std::string &text = asked.optional(parameter);
    if (text.size() > longest_text)
        throw refusal(error::parameter_invalid, parameter);
    return text;
}

} // namespace

std::int64_t viewer_of(const call &asked, std::int64_t folder)
{
    return asked.account != 0 && sees_folder(asked.state.store, asked.account, folder)
               ? asked.account
               : 0;
}

folder readable_folder(const call &asked, const char *parameter)
{
    const std::string &key = asked.optional(parameter);
    if (key.empty())
        return root_of_account(asked);
    folder found = any_folder(asked, key);
    if (found.privacy != "public" && viewer_of(asked, found.id) == 0)
        throw refusal(error::access_denied);
    return found;
}

file readable_file(const call &asked, const std::string &key)
{
    file found = any_file(asked, key);
    if (found.privacy != "public" && viewer_of(asked, found.folder) == 0)
        throw refusal(error::access_denied);
    return found;
}

folder copyable_folder(const call &asked, const char *parameter)
{
    asked.required(parameter);
    folder found = living(readable_folder(asked, parameter), error::folder_unknown);
    // Somebody who sees but the public part would not get a copy of the whole.
    if (viewer_of(asked, found.id) == 0)
        throw refusal(error::access_denied);
    if (found.is_root())
        throw refusal(error::is_root);
    return found;
}

file copyable_file(const call &asked)
{
    return living(readable_file(asked, asked.required("quick_key")), error::file_unknown);
}

folder own_folder(const call &asked, const char *parameter)
{
    folder found = living(any_folder(asked, asked.required(parameter)), error::folder_unknown);
    check_owner(asked, found);
    if (found.is_root())
        throw refusal(error::is_root);
    return found;
}

file own_file(const call &asked, const char *parameter)
{
    file found = living(any_file(asked, asked.required(parameter)), error::file_unknown);
    check_owner(asked, found);
    return found;
}

folder destination_folder(const call &asked, const char *parameter)
{
    const std::string &key = asked.optional(parameter);
    if (key.empty())
        return root_of_account(asked);
    folder found = living(any_folder(asked, key), error::folder_unknown);
    check_owner(asked, found);
    return found;
}

std::int64_t time_given(const call &asked, const char *parameter, std::int64_t otherwise)
{
    const std::string &text = asked.optional(parameter);
    if (text.empty())
        return otherwise;
    const auto time = parse_time(text);
    if (!time)
        throw refusal(error::parameter_invalid, parameter);
    return *time;
}

metadata_change change_given(const call &asked, const char *name_parameter)
{
    metadata_change change;
    if (!asked.optional(name_parameter).empty()) {
        change.name = asked.optional(name_parameter);
        check_name(*change.name, name_parameter);
    }
    if (asked.has("description"))
        change.description = text_given(asked, "description");
    if (asked.has("tags"))
        change.tags = text_given(asked, "tags");
    if (!asked.optional("privacy").empty()) {
        change.privacy = asked.optional("privacy");
        if (change.privacy != "public" && change.privacy != "private")
            throw refusal(error::parameter_invalid, "privacy");
    }
    if (!asked.optional("mtime").empty())
        change.modified = time_given(asked, "mtime", 0);
    return change;
}

bool yes_or_no(const call &asked, const char *parameter, bool otherwise)
{
    const std::string &text = asked.optional(parameter);
    if (text.empty())
        return otherwise;
    if (text != "yes" && text != "no")
        throw refusal(error::parameter_invalid, parameter);
    return text == "yes";
}

void check_device_id(const call &asked)
{
    const std::string &id = asked.optional("device_id");
    if (!id.empty() && !parse_decimal(id, std::numeric_limits<std::uint32_t>::max()))
        throw refusal(error::parameter_invalid, "device_id");
}

} // namespace emulator
