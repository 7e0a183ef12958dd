// A service with one file, whose bytes come as a test likes.
#pragma once

#include <functional>
#include <string>

#include <gtest/gtest.h>

#include "program.h"
#include "some_content.h"
#include "support/certificates.h"
#include "support/scripted_server.h"

namespace quillmere_test {

class fake_download : public testing::Test {
protected:
    /** The file has the key "k", and lies in a folder with the key "f", too. */
    fake_download();

    scripted_server server{tls_with(loopback_certificate())};
    program_home home;
    const std::string into = home.folder().path_of("into"); ///< to download to
    std::string name = "name";
    std::string bytes = some_bytes(10'000);
    std::string link = server.base_url() + "/bytes";
    std::function<std::string(const request &)> bytes_reply; ///< unless given, all of them
    connection_script on_bytes;                              ///< in its place, where it is given

private:
    std::string file_facts() const;
    std::string reply_to(const request &asked) const;
    void serve(connection &client) const;
};

} // namespace quillmere_test
