// A service that is a file: every operation's reply is read from it by libcurl's own hand, so that
// thousands of calls need no server and no other thread.
#pragma once

#include <string>

#include "support/globals_guard.h"
#include "support/library_fixture.h"
#include "support/temporary_folder.h"
#include "support/unread_log.h"

namespace quillmere_test {

class file_service {
public:
    // ca_path may be NULL, to run without a certificate authority.
    explicit file_service(const char *ca_path = nullptr);

    void answer(const std::string &reply);
    void answer_nothing(); // the transfer fails

private:
    globals_guard globals_;
    temporary_folder folder_;
    std::string base_;
    unread_log log_;
    running_library library_;
};

} // namespace quillmere_test
