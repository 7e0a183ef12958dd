// A folder's listing.
#include <memory>

#include "support/library.h"
#include "support/reference_records.h"

namespace quillmere_fuzz {
namespace {

const renamed folder_names = {{"name", "foldername"},
                              {"description", "desc"},
                              {"folder_count", "foldercount"},
                              {"file_count", "filecount"},
                              {"dropbox_enabled", "dbx_enabled"}};
const unread folder_rest = {"parent_folderkey", "total_files", "total_folders", "total_size",
                            "byte_count"};
const renamed file_names = {{"filetype", "type"}};
const unread file_rest = {"parent_folderkey"};

struct listing {
    std::vector<field_texts> folders;
    std::vector<field_texts> files;
};

enum class inside { nothing, folder, file };

// A record ends with the first end tag of its name, and one that starts inside another of its kind
// takes its place.
class reading {
public:
    void start(const std::string &name)
    {
        if (name == "folder")
            begin(folder_, inside::folder);
        else if (name == "file")
            begin(file_, inside::file);
        element_ = name;
    }

    void end(const std::string &name)
    {
        if (name == "folder")
            finish(folder_, read_.folders);
        else if (name == "file")
            finish(file_, read_.files);
        element_.reset();
    }

    void text(const std::string &piece)
    {
        if (!element_)
            return;
        if (place_ == inside::folder && folder_)
            add(*folder_, field_for<folder_info>(*element_, folder_names, folder_rest), piece);
        if (place_ == inside::file && file_)
            add(*file_, field_for<file_info>(*element_, file_names, file_rest), piece);
    }

    listing take() { return std::move(read_); }

private:
    void begin(std::optional<field_texts> &record, inside place)
    {
        record.emplace();
        place_ = place;
    }

    void finish(std::optional<field_texts> &record, std::vector<field_texts> &list)
    {
        if (record)
            list.push_back(*record);
        record.reset();
        place_ = inside::nothing;
    }

    static void add(field_texts &record, const std::optional<std::string> &field,
                    const std::string &piece)
    {
        if (field)
            record[*field] += piece;
    }

    listing read_;
    std::optional<field_texts> folder_;
    std::optional<field_texts> file_;
    std::optional<std::string> element_;
    inside place_ = inside::nothing;
};

listing read_listing(const document &reply)
{
    reading running;
    for (const event &each : reply.events) {
        if (each.what == happening::start)
            running.start(each.text);
        else if (each.what == happening::end)
            running.end(each.text);
        else
            running.text(each.text);
    }
    return running.take();
}

using owned_folders = std::unique_ptr<folder_list, void (*)(folder_list *)>;
using owned_files = std::unique_ptr<file_list, void (*)(file_list *)>;

void try_listing(std::string_view input)
{
    silence_log();
    std::string xml(input);
    owned_folders folders(folder_info_list_new(),
                          [](folder_list *list) { delete_all_folder_list(&list); });
    owned_files files(file_info_list_new(), [](file_list *list) { delete_all_file_list(&list); });
    int32_t folder_count = 0;
    int32_t file_count = 0;
    uint32_t parse_failed = 77;
    within_budget(listed, input.size(), [&] {
        parse_failed = simple_extract_folders_content(xml.c_str(), xml.size(), folders.get(),
                                                      &folder_count, files.get(), &file_count);
    });
    expect(length_of(folders.get()) == folder_count, "as many folders as are counted");
    expect(length_of(files.get()) == file_count, "as many files as are counted");
    if (xml.size() > most_bytes_to_compare)
        return;

    document reply = read_document(xml);
    listing expected = read_listing(reply);
    expect(parse_failed == (reply.well_formed ? 0 : 1), "the listing tells damage");
    expect(records_in(folders.get()) == expected.folders, "the folders");
    expect(records_in(files.get()) == expected.files, "the files");
}

const known_target folder_content("folder_content", try_listing);

} // namespace
} // namespace quillmere_fuzz
