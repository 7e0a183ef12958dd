#include "folder_content.h"

#include <string_view>
#include <unordered_set>

namespace quillmere::tools {

namespace {

using known_keys = std::unordered_set<std::string_view>;

struct chunk {
    folder_list_owner folders;
    file_list_owner files;
    std::int32_t entries = 0;
    std::int32_t size = 0; // the most that a chunk holds
};

chunk read_chunk(const account &owner, const remote_entry &folder, entry_kind kind, int number)
{
    const std::string number_text = std::to_string(number);
    const std::string content_type = std::string(word_for(kind)) + "s";
    folder_list *folders = nullptr;
    file_list *files = nullptr;
    std::int32_t folder_count = 0;
    std::int32_t file_count = 0;
    std::int32_t size = 0;
    owner.remote.read(
        "listing " + (folder.is_root() ? "/" : folder.name), [&](char **error_message) {
            return get_folder_content(owner.session(), folder.key_or_null(), nullptr,
                                      number_text.c_str(), content_type.c_str(), error_message,
                                      &folders, &folder_count, &files, &file_count, &size);
        });
    return {folder_list_owner(folders), file_list_owner(files), folder_count + file_count, size};
}

// Entries that come and go while the chunks are read move others from one chunk to the next, so
// that some come twice. One without a key could not be used for anything.
template <class Record>
void add_new(const std::vector<Record *> &records, const char *(*key_of)(const Record *),
             known_keys &known, std::vector<const Record *> &all)
{
    for (const Record *each : records) {
        const char *const key = key_of(each);
        if (key != nullptr && known.insert(key).second)
            all.push_back(each);
    }
}

void add_chunk(chunk added, known_keys &known, folder_content &content)
{
    add_new(in_order_sent(added.folders.get()), folder_info_get_folderkey, known, content.folders);
    add_new(in_order_sent(added.files.get()), file_info_get_quickkey, known, content.files);
    content.folder_chunks.push_back(std::move(added.folders));
    content.file_chunks.push_back(std::move(added.files));
}

} // namespace

folder_content read_content(const account &owner, const remote_entry &folder,
                            const std::vector<entry_kind> &wanted)
{
    folder_content content;
    known_keys known;
    for (const entry_kind kind : wanted) {
        for (int number = 1;; ++number) {
            chunk next = read_chunk(owner, folder, kind, number);
            const bool last = next.entries < next.size;
            const std::size_t before = known.size();
            add_chunk(std::move(next), known, content);
            // A service that answers with the same chunk for ever is left here.
            if (last || known.size() == before)
                break;
        }
    }
    return content;
}

} // namespace quillmere::tools
