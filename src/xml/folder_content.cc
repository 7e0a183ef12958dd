// A folder's listing, read into a list of folders and a list of files.
#include <utility>

#include "xml/extractor.h"
#include "xml/list_extraction.h"

namespace quillmere {

namespace {

constexpr int32_t outside = 0;
constexpr int32_t in_folder = 1;
constexpr int32_t in_file = 2;

// The service names a description and a name differently in folders and in files.
constexpr element_field<folder_info> folder_elements[] = {
    {"folderkey", &folder_info::folderkey},
    {"name", &folder_info::foldername},
    {"created", &folder_info::created},
    {"description", &folder_info::desc},
    {"tags", &folder_info::tags},
    {"folder_count", &folder_info::foldercount},
    {"file_count", &folder_info::filecount},
    {"revision", &folder_info::revision},
    {"epoch", &folder_info::epoch},
    {"shared", &folder_info::shared},
    {"owner_name", &folder_info::owner_name},
    {"delete_date", &folder_info::delete_date},
    {"custom_url", &folder_info::custom_url},
    {"dropbox_enabled", &folder_info::dbx_enabled},
    {"flag", &folder_info::flag},
    {"shared_by_user", &folder_info::shared_by_user},
    {"permissions", &folder_info::permissions},
    {"avatar", &folder_info::avatar},
    {"privacy", &folder_info::privacy},
};

constexpr element_field<file_info> file_elements[] = {
    {"quickkey", &file_info::quickkey},
    {"filename", &file_info::filename},
    {"created", &file_info::created},
    {"downloads", &file_info::downloads},
    {"desc", &file_info::desc},
    {"tags", &file_info::tags},
    {"size", &file_info::size},
    {"privacy", &file_info::privacy},
    {"filetype", &file_info::type},
    {"mimetype", &file_info::mimetype},
    {"hash", &file_info::hash},
    {"delete_date", &file_info::delete_date},
    {"password_protected", &file_info::password_protected},
    {"revision", &file_info::revision},
    {"owner_name", &file_info::owner_name},
    {"flag", &file_info::flag},
    {"shared_by_user", &file_info::shared_by_user},
    {"permissions", &file_info::permissions},
};

constexpr auto folder_index = index_of(folder_elements);
constexpr auto file_index = index_of(file_elements);

// The public state comes first, so that the exported callbacks can take the whole for it.
struct extraction {
    folder_content_state state;
    field_joiner<folder_info, std::size(folder_elements)> folder_texts{folder_elements};
    field_joiner<file_info, std::size(file_elements)> file_texts{file_elements};
};

template <class FolderJoiner, class FileJoiner>
void add_text(folder_content_state &state, FolderJoiner &&folders, FileJoiner &&files,
              const char *text, int length)
{
    if (!state.current_element)
        return;
    if (state.mode == in_folder && state.current_folder)
        folders.append(*state.current_folder, state.current_element, text, length);
    else if (state.mode == in_file && state.current_file)
        files.append(*state.current_file, state.current_element, text, length);
}

void extract_text(void *user_data, const char *text, int length)
{
    auto *running = static_cast<extraction *>(user_data);
    add_text(running->state, running->folder_texts, running->file_texts, text, length);
}

// A record counts when it is added: in a damaged document an end tag may find none open.
void finish_folder(folder_content_state &state)
{
    if (state.current_folder)
        state.folder_count += 1;
    add_to_folder_list(state.folders, std::exchange(state.current_folder, nullptr));
    state.mode = outside;
}

void finish_file(folder_content_state &state)
{
    if (state.current_file)
        state.file_count += 1;
    add_to_file_list(state.files, std::exchange(state.current_file, nullptr));
    state.mode = outside;
}

// What a damaged document left open.
void release_open_records(folder_content_state &state)
{
    forget_element(&state.current_element);
    folder_info_delete(&state.current_folder);
    file_info_delete(&state.current_file);
}

void log_counts(int32_t folder_count, int32_t file_count)
{
    qm_printf("xml extract: folder size: %d, file size: %d\n", folder_count, file_count);
}

} // namespace

uint32_t folder_content_extraction::extract(const char *xml, uint64_t length, folder_list *folders,
                                            int32_t *folder_count, file_list *files,
                                            int32_t *file_count)
{
    if (!whole())
        return simple_extract_folders_content(xml, length, folders, folder_count, files,
                                              file_count);
    log_counts(folders_.count(), files_.count());
    *folder_count = folders_.count();
    *file_count = files_.count();
    folders_.move_to(folders);
    files_.move_to(files);
    return 0;
}

bool folder_content_extraction::start(const element_name &element)
{
    target_ = {};
    if (is(element.text, "folder")) {
        folder_ = new_record<folder_info>();
        place_ = place::folder;
    } else if (is(element.text, "file")) {
        file_ = new_record<file_info>();
        place_ = place::file;
    } else if (place_ == place::folder && folder_) {
        target_ = text_target_of(*folder_, folder_elements, folder_index, folder_texts_, element);
    } else if (place_ == place::file && file_) {
        target_ = text_target_of(*file_, file_elements, file_index, file_texts_, element);
    }
    return true;
}

void folder_content_extraction::end(const char *element)
{
    target_ = {};
    if (is(element, "folder"))
        folders_.add(std::move(folder_));
    else if (is(element, "file"))
        files_.add(std::move(file_));
}

void folder_content_extraction::discard()
{
    folders_.clear();
    files_.clear();
    folder_.reset();
    file_.reset();
}

} // namespace quillmere

using namespace quillmere;

uint32_t simple_extract_folders_content(const char *xml, uint64_t length, folder_list *folders,
                                        int32_t *folder_count, file_list *files,
                                        int32_t *file_count)
{
    if (!xml || length == 0)
        return 0;

    extraction running = {};
    running.state.files = files;
    running.state.folders = folders;
    xml_parser parser =
        new_document_parser(&running, {simple_extract_folders_node_value_start,
                                       simple_extract_folders_node_value_end, extract_text});
    XML_Status status = parse_document(parser, xml, length);

    log_counts(running.state.folder_count, running.state.file_count);
    *folder_count = running.state.folder_count;
    *file_count = running.state.file_count;
    release_open_records(running.state);
    return status == XML_STATUS_OK ? 0 : 1;
}

void simple_extract_folders_node_value_start(void *state, const char *element, const char **)
{
    auto *content = static_cast<folder_content_state *>(state);
    if (is(element, "folder")) {
        folder_info_delete(&content->current_folder);
        content->current_folder = new_record<folder_info>().release();
        content->mode = in_folder;
    } else if (is(element, "file")) {
        file_info_delete(&content->current_file);
        content->current_file = new_record<file_info>().release();
        content->mode = in_file;
    }
    remember_element(&content->current_element, element);
}

void simple_extract_folders_node_value_end(void *state, const char *element)
{
    auto *content = static_cast<folder_content_state *>(state);
    if (is(element, "folder"))
        finish_folder(*content);
    else if (is(element, "file"))
        finish_file(*content);
    forget_element(&content->current_element);
}

void simple_extract_folders_node_value_data(void *state, const char *text, int32_t length)
{
    add_text(*static_cast<folder_content_state *>(state), measuring_joiner(folder_elements),
             measuring_joiner(file_elements), text, length);
}
