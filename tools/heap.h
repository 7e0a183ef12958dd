// Owners for what the library hands out.
#pragma once

#include <algorithm>
#include <memory>
#include <vector>

#include <quillmere.h>

namespace quillmere::tools {

struct free_text {
    void operator()(char *text) const { api_free(text); }
};
using heap_text = std::unique_ptr<char, free_text>;

/** Releases a record through its own function, which takes the pointer's address. */
template <auto Delete> struct delete_record {
    template <class Record> void operator()(Record *record) const { Delete(&record); }
};
using system_limits_owner = std::unique_ptr<system_limits, delete_record<system_limits_delete>>;
using system_status_owner = std::unique_ptr<system_status, delete_record<system_status_delete>>;
using user_info_owner = std::unique_ptr<user_info, delete_record<user_info_delete>>;
using user_limits_owner = std::unique_ptr<user_limits, delete_record<user_limits_delete>>;
using folder_info_owner = std::unique_ptr<folder_info, delete_record<folder_info_delete>>;
using file_info_owner = std::unique_ptr<file_info, delete_record<file_info_delete>>;

/** Lists are deleted in the same way, their records with them. */
using folder_list_owner = std::unique_ptr<folder_list, delete_record<delete_all_folder_list>>;
using file_list_owner = std::unique_ptr<file_list, delete_record<delete_all_file_list>>;
using change_list_owner = std::unique_ptr<change_list, delete_record<delete_all_change_list>>;
using file_links_list_owner =
    std::unique_ptr<file_links_list, delete_record<delete_all_file_links_list>>;

/** The records of a list in the order in which the service sent them. A list has its newest record
 * first, which is the one that was sent last. */
template <class List> auto in_order_sent(const List *list)
{
    std::vector<decltype(list->record)> records;
    for (const List *node = list == nullptr ? nullptr : list->next; node != nullptr;
         node = node->next)
        records.push_back(node->record);
    std::reverse(records.begin(), records.end());
    return records;
}

} // namespace quillmere::tools
