// The emulator as a process of its own, with accounts, and the library led to it.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "support/globals_guard.h"
#include "support/library_fixture.h"
#include "support/process.h"
#include "support/temporary_folder.h"

namespace quillmere_test {

// Text that the library handed out.
struct free_text {
    void operator()(char *text) const { api_free(text); }
};
using owned_text = std::unique_ptr<char, free_text>;

// What an out-parameter received, with NULL as an empty text.
std::string taken(char *text);

inline constexpr const char *emulated_password = "a pass word & more";

class emulated_service {
public:
    emulated_service();

    // An account with the password above.
    void add_account(const std::string &email) const;

    // Runs a command of the emulator on the service's data and returns what it printed.
    std::string command_output(std::vector<std::string> arguments,
                               const std::string &input = {}) const;

    const std::string &https_url() const { return https_url_; }
    const std::string &http_url() const { return http_url_; }
    const std::string &root_path() const { return root_path_; }
    const temporary_folder &folder() const { return folder_; }
    process &emulator() { return *emulator_; }

private:
    void start();

    temporary_folder folder_;
    std::unique_ptr<process> emulator_;
    std::string https_url_;
    std::string http_url_;
    std::string root_path_;
};

// How operations reach the service. A new TLS connection for each makes a long run slow.
enum class reached_over { tls, plain };

// A started library whose operations reach the service. Its log is not kept.
class library_on_service {
public:
    explicit library_on_service(const emulated_service &service,
                                reached_over way = reached_over::tls);
    library_on_service(const library_on_service &) = delete;
    library_on_service &operator=(const library_on_service &) = delete;

    // A session of an account that add_account() made.
    std::string session_of(const std::string &email) const;

private:
    proxyless_environment environment_;
    globals_guard globals_;
    std::string bases_[4];
    std::unique_ptr<std::FILE, int (*)(std::FILE *)> log_;
    running_library library_;
};

} // namespace quillmere_test
