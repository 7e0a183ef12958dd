// How do I ask from many threads at once?
//
//     many_threads QUICK-KEY...
//
// Reads the records of the files with eight threads and prints size and name of each, in the order
// of the arguments.
//
// Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
//              QUILLMERE_CA_FILE   the root certificate that vouches for it (PEM)
//              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include <quillmere.h>

namespace {

using owned_text = std::unique_ptr<char, decltype(&api_free)>;

std::string text_of(const char *text) { return text ? text : ""; }

struct answer {
    int32_t status;
    std::string text; // of the file, or why there is none
};

// The session token may be used by all threads at once; what an operation hands out belongs to the
// thread that called it.
answer ask(const char *token, const char *quick_key)
{
    file_info *info = nullptr;
    char *message = nullptr;
    const int32_t status = get_file_info(quick_key, token, &message, &info);
    const owned_text owned(message, api_free);
    if (status != QM_OK)
        return {status, std::to_string(status) + " " + text_of(message)};
    answer got{status,
               text_of(file_info_get_size(info)) + " " + text_of(file_info_get_filename(info))};
    file_info_delete(&info);
    return got;
}

// Operations block, so threads that wait for the service cost next to nothing; each has a
// connection of its own.
std::vector<answer> ask_all(const char *token, const std::vector<const char *> &quick_keys)
{
    std::vector<answer> answers(quick_keys.size());
    std::atomic<std::size_t> next{0};
    std::vector<std::thread> threads;
    for (int count = 0; count < 8; ++count)
        threads.emplace_back([&] {
            for (std::size_t mine; (mine = next++) < quick_keys.size();)
                answers[mine] = ask(token, quick_keys[mine]);
        });
    for (std::thread &each : threads)
        each.join();
    return answers;
}

bool show_all(const std::vector<answer> &answers)
{
    bool all_known = true;
    for (const answer &each : answers) {
        (each.status == QM_OK ? std::cout : std::cerr) << each.text << '\n';
        all_known = all_known && each.status == QM_OK;
    }
    return all_known;
}

owned_text log_in()
{
    // The application's own id and key; these are what a fresh emulator knows.
    char *token = nullptr;
    const int32_t status =
        get_session_token(std::getenv("QUILLMERE_EMAIL"), std::getenv("QUILLMERE_PASSWORD"),
                          nullptr, "42", "quillmere-development-key", &token);
    owned_text owned(token, api_free);
    if (status == QM_OK)
        return owned;
    // What is handed out with a malformed reply may be the token: nothing to show.
    const char *shown = status == QM_MALFORMED_REPLY ? "" : token;
    std::cerr << "logging in failed: " << status << ' ' << text_of(shown) << '\n';
    return {nullptr, api_free};
}

} // namespace

int main(int argc, char **argv)
{
    const std::unique_ptr<FILE, decltype(&fclose)> log(fopen("/dev/null", "w"), fclose);
    const char *ca_file = std::getenv("QUILLMERE_CA_FILE");
    urls[1] = std::getenv("QUILLMERE_SERVICE");
    if (argc < 2 || !log || !ca_file || !urls[1]) {
        std::cerr << "usage: many_threads QUICK-KEY...; its source tells of the environment\n";
        return 2;
    }
    // All settings come first and are left alone until the threads have ended: they have no lock.
    set_output_file(log.get()); // it shows session tokens, so keep it from the terminal
    api_global_init(ca_file);

    bool done = false;
    if (const owned_text token = log_in())
        done = show_all(ask_all(token.get(), {argv + 1, argv + argc}));

    api_global_cleanup(); // after the last request has returned
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
