// Lists of records. A list's first node holds no record, and new ones go right behind it, so that
// adding costs the same however long the list has become.
#include <cstdlib>

#include "records/records.h"

namespace quillmere {

namespace {

template <class List, class Record> void add(List *list, Record *record)
{
    if (!list || !record)
        return;
    List *node = allocate_zeroed<List>();
    node->record = record;
    node->next = list->next;
    list->next = node;
}

template <class List> void delete_all(List **list)
{
    if (!list)
        return;
    for (List *node = *list; node;) {
        List *next = node->next;
        delete_record(node->record);
        std::free(node);
        node = next;
    }
}

} // namespace

} // namespace quillmere

using namespace quillmere;

file_list *file_info_list_new(void) { return allocate_zeroed<file_list>(); }

folder_list *folder_info_list_new(void) { return allocate_zeroed<folder_list>(); }

change_list *change_list_new(void) { return allocate_zeroed<change_list>(); }

file_links_list *file_links_list_new(void) { return allocate_zeroed<file_links_list>(); }

void add_to_file_list(file_list *list, file_info *record) { add(list, record); }

void add_to_folder_list(folder_list *list, folder_info *record) { add(list, record); }

void add_to_change_list(change_list *list, change_info *record) { add(list, record); }

void add_to_file_links_list(file_links_list *list, file_links *record) { add(list, record); }

void delete_all_file_list(file_list **list) { delete_all(list); }

void delete_all_folder_list(folder_list **list) { delete_all(list); }

void delete_all_change_list(change_list **list) { delete_all(list); }

void delete_all_file_links_list(file_links_list **list) { delete_all(list); }
