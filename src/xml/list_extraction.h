// The lists of a reply, extracted in the pass that reads everything else of it.
#pragma once

#include <utility>

#include "records/records.h"
#include "xml/element_index.h"
#include "xml/joined_text.h"

namespace quillmere {

// A list in the making. A pass tells it what it meets. Who wants the list asks for it afterwards,
// with the arguments of the exported extractor, and gets what that one makes, with its log lines:
// from the pass or, if there was none or it failed, from the extractor itself.
class list_extraction {
public:
    list_extraction() = default;
    list_extraction(const list_extraction &) = delete;
    list_extraction &operator=(const list_extraction &) = delete;

    // False if the pass must not go on.
    virtual bool start(const element_name &element) = 0;
    virtual void end(const char *element) = 0;
    virtual void text(const char *piece, int length) = 0;

    // A pass that was not whole leaves nothing behind.
    void finish(bool whole)
    {
        whole_ = whole;
        if (!whole)
            discard();
    }

protected:
    ~list_extraction() = default;

    virtual void discard() = 0;

    bool whole() const { return whole_; }

private:
    bool whole_ = false;
};

// A field of a record, and where its text ends: what text goes to until the next tag.
struct text_target {
    char **value = nullptr;
    joined_text *joined = nullptr;

    void append(const char *piece, int length) const
    {
        if (value)
            joined->append(value, piece, length);
    }
};

// The field for an element's text, if a table lists it.
template <class Record, size_t count>
text_target text_target_of(Record &record, const element_field<Record> (&table)[count],
                           const element_index<count> &index, joined_text (&texts)[count],
                           const element_name &element)
{
    uint8_t row = index.table().find(element);
    if (row == element_table::no_row)
        return {};
    return {&(record.*table[row].field), &texts[row]};
}

// Records on their way to a caller's list.
template <class List, auto Add, auto DeleteAll> class gathered_list {
public:
    gathered_list() = default;
    ~gathered_list() { clear(); }
    gathered_list(const gathered_list &) = delete;
    gathered_list &operator=(const gathered_list &) = delete;

    // No record is none to add.
    template <class Record> void add(owned_record<Record> record)
    {
        if (!record)
            return;
        Add(&first_, record.release());
        count_ += 1;
    }

    void clear()
    {
        List *nodes = std::exchange(first_.next, nullptr);
        DeleteAll(&nodes);
        count_ = 0;
    }

    // To a list that is empty.
    void move_to(List *list) { list->next = std::exchange(first_.next, nullptr); }

    int32_t count() const { return count_; }

private:
    List first_ = {}; // which holds no record, like that of any list
    int32_t count_ = 0;
};

// A folder's listing.
class folder_content_extraction final : public list_extraction {
public:
    // Both lists are empty ones.
    uint32_t extract(const char *xml, uint64_t length, folder_list *folders, int32_t *folder_count,
                     file_list *files, int32_t *file_count);

    bool start(const element_name &element) override;
    void end(const char *element) override;
    void text(const char *piece, int length) override { target_.append(piece, length); }

private:
    // Where the record started last is; once it has ended, there is no record in that place.
    enum class place { folder, file };

    void discard() override;

    gathered_list<folder_list, add_to_folder_list, delete_all_folder_list> folders_;
    gathered_list<file_list, add_to_file_list, delete_all_file_list> files_;
    owned_record<folder_info> folder_;
    owned_record<file_info> file_;
    joined_text folder_texts_[19];
    joined_text file_texts_[18];
    text_target target_;
    place place_ = place::folder;
};

// A device change feed.
class changes_extraction final : public list_extraction {
public:
    // The list is an empty one.
    uint32_t extract(const char *xml, uint64_t length, change_list *changes,
                     uint32_t *change_count);

    bool start(const element_name &element) override;
    void end(const char *element) override;
    void text(const char *piece, int length) override;

private:
    // What the text that comes next says beside what goes into a field.
    enum class meaning { none, key, revision };

    void discard() override;
    bool start_record();
    void lead_text(uint8_t row);
    void stop_text();

    gathered_list<change_list, add_to_change_list, delete_all_change_list> changes_;
    owned_record<change_info> change_;
    joined_text texts_[6];
    text_target target_;
    meaning meaning_ = meaning::none;
    int32_t change_type_ = 0;
    int32_t object_kind_ = 0;
};

// The links of files.
class links_extraction final : public list_extraction {
public:
    // The list is an empty one.
    uint32_t extract(const char *xml, uint64_t length, file_links_list *links, int32_t *link_count);

    bool start(const element_name &element) override;
    void end(const char *element) override;
    void text(const char *piece, int length) override { target_.append(piece, length); }

private:
    void discard() override;

    gathered_list<file_links_list, add_to_file_links_list, delete_all_file_links_list> links_;
    owned_record<file_links> link_;
    joined_text texts_[13];
    text_target target_;
};

} // namespace quillmere
