// The feed of changes.
#include <cstdlib>
#include <memory>

#include "support/library.h"
#include "support/reference_records.h"

namespace quillmere_fuzz {
namespace {

struct change {
    field_texts texts;
    uint64_t revision = 0;
    int32_t is_folder = 0;
    int32_t type = 0;

    bool operator==(const change &other) const
    {
        return texts == other.texts && revision == other.revision && is_folder == other.is_folder &&
               type == other.type;
    }
};

struct feed {
    std::vector<change> changes;
    bool stopped = false; // at a record within a record
};

class reading {
public:
    // False when the rest is not to be read.
    bool start(const std::string &name)
    {
        if (name == "updated" || name == "deleted")
            type_ = name == "updated" ? 1 : 0;
        if (name == "files" || name == "folders")
            kind_ = name == "folders" ? 1 : 0;
        if (name == "file" || name == "folder") {
            if (open_)
                return false;
            open_ = change{{}, 0, kind_, type_};
        }
        element_ = name;
        return true;
    }

    void end(const std::string &name)
    {
        if ((name == "file" || name == "folder") && open_) {
            read_.push_back(*open_);
            open_.reset();
        }
        element_.reset();
    }

    void text(const std::string &piece)
    {
        if (!open_ || !element_)
            return;
        const std::string key = kind_ == 1 ? "folderkey" : "quickkey";
        if (*element_ == "revision")
            open_->revision = std::strtoul(piece.c_str(), nullptr, 10); // of the last piece
        else if (*element_ == key)
            add_key(piece);
        else if (*element_ == "parent_folderkey" || (kind_ == 0 && is_file_text(*element_)))
            open_->texts[*element_] += piece;
    }

    std::vector<change> take() { return std::move(read_); }

private:
    void add_key(const std::string &piece)
    {
        open_->texts["key"] += piece;
        open_->is_folder = kind_;
    }

    static bool is_file_text(const std::string &name)
    {
        return name == "created" || name == "filename" || name == "mimetype" || name == "filetype";
    }

    std::vector<change> read_;
    std::optional<change> open_;
    std::optional<std::string> element_;
    int32_t type_ = 0;
    int32_t kind_ = 0;
};

feed read_feed(const document &reply)
{
    reading running;
    for (const event &each : reply.events) {
        if (each.what == happening::start && !running.start(each.text))
            return {running.take(), true};
        if (each.what == happening::end)
            running.end(each.text);
        else if (each.what == happening::text)
            running.text(each.text);
    }
    return {running.take(), false};
}

std::vector<change> changes_in(const change_list *list)
{
    std::vector<change> changes;
    for (const change_list *node = list->next; node; node = node->next)
        changes.insert(changes.begin(),
                       {fields_of(node->record), change_info_get_revision(node->record),
                        change_info_get_is_folder(node->record),
                        change_info_get_changetype(node->record)});
    return changes;
}

using owned_changes = std::unique_ptr<change_list, void (*)(change_list *)>;

void try_feed(std::string_view input)
{
    silence_log();
    std::string xml(input);
    owned_changes changes(change_list_new(),
                          [](change_list *list) { delete_all_change_list(&list); });
    uint32_t count = 0;
    uint32_t parse_failed = 77;
    within_budget(listed, input.size(), [&] {
        parse_failed = simple_extract_changes(xml.c_str(), xml.size(), changes.get(), &count);
    });
    expect(length_of(changes.get()) == static_cast<int32_t>(count), "as many changes as counted");
    if (xml.size() > most_bytes_to_compare)
        return;

    document reply = read_document(xml);
    feed expected = read_feed(reply);
    expect(parse_failed == (reply.well_formed && !expected.stopped ? 0 : 1),
           "the feed tells damage");
    expect(changes_in(changes.get()) == expected.changes, "the changes");
}

const known_target changes("changes", try_feed);

} // namespace
} // namespace quillmere_fuzz
