// How do I walk the whole tree of an account?
//
//     walk_tree
//
// Prints the path of every folder and file, and how many bytes they hold together.
//
// Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
//              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
//              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include <quillmere.h>

namespace {

using owned_text = std::unique_ptr<char, decltype(&api_free)>;

// The library's functions that delete take the address of the pointer.
template <auto Delete> struct deleted_by {
    template <class List> void operator()(List *list) const { Delete(&list); }
};
using owned_folders = std::unique_ptr<folder_list, deleted_by<delete_all_folder_list>>;
using owned_files = std::unique_ptr<file_list, deleted_by<delete_all_file_list>>;

std::string text_of(const char *text) { return text ? text : ""; }

// Takes the message over.
void require(int32_t status, const std::string &step, char *message)
{
    const owned_text owned(message, api_free);
    if (status == QM_OK)
        return;
    // What a login hands out with a malformed reply may be the token: nothing to show.
    const std::string shown = status == QM_MALFORMED_REPLY ? "" : text_of(message);
    throw std::runtime_error(step + " failed: " + std::to_string(status) + " " + shown);
}

owned_text log_in()
{
    // The application's own id and key; these are what a fresh emulator knows.
    char *token = nullptr;
    const int32_t status =
        get_session_token(std::getenv("QUILLMERE_EMAIL"), std::getenv("QUILLMERE_PASSWORD"),
                          nullptr, "42", "quillmere-development-key", &token);
    require(status, "logging in", status == QM_OK ? nullptr : token);
    return {token, api_free};
}

struct folder {
    std::string key; // empty for the root
    std::string path;
};

class tree_walk {
public:
    explicit tree_walk(const char *token) : token_(token) {}

    unsigned long long run()
    {
        // What is still to do is a list, not a recursion: others choose how deep the tree is.
        while (!waiting_.empty()) {
            const folder next = std::move(waiting_.back());
            waiting_.pop_back();
            for (const char *content_type : {"files", "folders"})
                for (int chunk = 1; list_chunk(next, content_type, chunk); ++chunk) {
                }
        }
        return bytes_;
    }

private:
    // Returns whether the chunk was full, so that there may be another.
    bool list_chunk(const folder &in, const char *content_type, int chunk)
    {
        folder_list *folder_chunk = nullptr;
        file_list *file_chunk = nullptr;
        int32_t folder_count = 0, file_count = 0, chunk_size = 0;
        char *message = nullptr;
        const int32_t status = get_folder_content(
            token_, in.key.c_str(), nullptr, std::to_string(chunk).c_str(), content_type, &message,
            &folder_chunk, &folder_count, &file_chunk, &file_count, &chunk_size);
        const owned_folders folders(folder_chunk);
        const owned_files files(file_chunk);
        require(status, "listing", message);

        // A list begins with a node that holds no record.
        for (const file_list *node = files ? files->next : nullptr; node; node = node->next)
            add(in, node->record);
        for (const folder_list *node = folders ? folders->next : nullptr; node; node = node->next)
            add(in, node->record);
        const int32_t count = folder_count + file_count;
        return count > 0 && count >= chunk_size;
    }

    void add(const folder &in, const file_info *file)
    {
        std::cout << in.path << text_of(file_info_get_filename(file)) << '\n';
        bytes_ += std::strtoull(text_of(file_info_get_size(file)).c_str(), nullptr, 10);
    }

    void add(const folder &in, const folder_info *found)
    {
        const std::string key = text_of(folder_info_get_folderkey(found));
        const std::string path = in.path + text_of(folder_info_get_foldername(found)) + '/';
        // Met twice: it was moved while we walk. Without a key it would be listed as the root.
        if (key.empty() || !met_.insert(key).second)
            return;
        std::cout << path << '\n';
        waiting_.push_back({key, path});
    }

    const char *token_;
    std::vector<folder> waiting_{{"", "/"}};
    std::set<std::string> met_;
    unsigned long long bytes_ = 0;
};

struct running_library {
    explicit running_library(const char *ca_file) { api_global_init(ca_file); }
    ~running_library() { api_global_cleanup(); }
};

} // namespace

int main()
try {
    const std::unique_ptr<FILE, decltype(&fclose)> log(fopen("/dev/null", "w"), fclose);
    const char *ca_file = std::getenv("QUILLMERE_CA_FILE");
    urls[1] = std::getenv("QUILLMERE_SERVICE");
    if (!log || !ca_file || !urls[1])
        throw std::runtime_error("usage: walk_tree; its source tells of the environment");
    set_output_file(log.get()); // it shows session tokens, so keep it from the terminal

    const running_library library(ca_file);
    const owned_text token = log_in();
    std::cout << tree_walk(token.get()).run() << " bytes\n";
} catch (const std::exception &failure) {
    std::cerr << failure.what() << '\n';
    return EXIT_FAILURE;
}
