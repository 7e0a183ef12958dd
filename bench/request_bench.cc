// What a request costs its process beside raw libcurl with the same options, which discards the
// body, and one pass of expat over the reply: over TLS to a server in another process.
//
//   request_bench BUNDLE      the system's file of certificate authorities
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include <sys/stat.h>

#include "calls.h"
#include "demanded.h"
#include "measured.h"
#include "quillmere.h"
#include "references.h"
#include "replies.h"
#include "support/certificates.h"
#include "support/library_fixture.h"
#include "support/log_capture.h"
#include "support/quick_server.h"
#include "support/temporary_folder.h"
#include "support/unread_log.h"

namespace {

using namespace quillmere_bench;
using quillmere_test::quick_server_process;
using quillmere_test::request;

struct subject {
    const char *name;
    void (*call)();
    void (*make_result)();
    std::string reply;
    std::string url = {};
};

// The one that it asks for, by its own log.
std::string url_asked_by(void (*call)())
{
    quillmere_test::log_capture log;
    call();
    const std::string text = log.text();
    size_t start = text.find("https:");
    return text.substr(start, text.find('\n', start) - start);
}

class bench {
public:
    bench(std::string base, std::string one_certificate, std::string bundle)
        : base_(std::move(base)), one_certificate_(std::move(one_certificate)),
          bundle_(std::move(bundle))
    {
        urls[1] = base_.c_str();
    }

    void run()
    {
        start(one_certificate_);
        for (subject *each : {&folder, &user, &content, &changes})
            each->url = url_asked_by(each->call);
        print_heading();
        measure_new_connections();
        measure_kept_connections();
        measure_threads();
        start(bundle_);
        measure_bundle();
        api_global_cleanup();
    }

private:
    void start(const std::string &ca_path)
    {
        api_global_cleanup();
        api_global_init(ca_path.c_str());
        set_default_timeout(60);
        ca_path_ = ca_path;
    }

    void raw_call(const subject &what) const
    {
        raw_exchange(what.url, ca_path_);
        parse_once(what.reply.data(), what.reply.size());
    }

    void measure_new_connections()
    {
        measure({"`get_folder_info`, new connection", 1.03, folder.call, [&] { raw_call(folder); },
                 20});
        measure({"`get_user_info`, new connection", 1.03, user.call, [&] { raw_call(user); }, 20});
        measure({"`get_folder_content`, 1,000 entries, new connection", 1.30, content.call,
                 [&] { raw_call(content); }, 7});
        measure({"`get_device_changes`, 500 entries, new connection", 1.15, changes.call,
                 [&] { raw_call(changes); }, 7});
        measure({"`get_response_from_url`, new connection", 0.85, [&] { plain_exchange(); },
                 [&] { raw_exchange(folder.url, ca_path_); }, 20});
        measure({"libcurl alone that verifies nothing, beside itself with one certificate",
                 no_figure, [&] { unverified_exchange(folder.url); },
                 [&] { raw_exchange(folder.url, ca_path_); }, 20});
    }

    void plain_exchange() const
    {
        char *response = nullptr;
        uint64_t length = 0;
        if (get_response_from_url(folder.url.c_str(), nullptr, 0, &response, &length, 0) != 200)
            std::exit(1);
        std::free(response);
    }

    void measure_bundle()
    {
        measure({"`get_folder_info`, full bundle, beside libcurl alone", 0.05, folder.call,
                 [&] { raw_exchange(folder.url, ca_path_); }, 10});
    }

    void measure_kept_connections()
    {
        set_connection_reuse(1);
        measure_kept(folder, 1.10, 500);
        measure_kept(content, 1.45, 7);
        // A round begins with a new connection for either, since switching closes the kept one.
        auto hundreds = [&](int32_t kept) {
            set_connection_reuse(kept);
            for (int call = 0; call < 200; ++call)
                folder.call();
        };
        measure({"200 times `get_folder_info`, kept connection beside new ones", 0.05,
                 [&] { hundreds(1); }, [&] { hundreds(0); }},
                15);
        set_connection_reuse(0);
    }

    void measure_kept(const subject &what, double at_most, unsigned calls) const
    {
        raw_handle handle = new_raw_handle(what.url, ca_path_);
        // From one connection to the next a request may cost a third more or less, for as long as
        // the connection lasts. So each round has new ones.
        auto reconnect = [&] {
            set_connection_reuse(0);
            set_connection_reuse(1);
            what.call();
            handle = new_raw_handle(what.url, ca_path_);
            perform(handle.get());
        };
        auto raw = [&] {
            perform(handle.get());
            parse_once(what.reply.data(), what.reply.size());
        };
        auto least = [&] {
            log_lines(what.reply.c_str());
            struct stat state = {};
            ::stat(ca_path_.c_str(), &state); // it may be another by now
            curl_easy_reset(handle.get());
            set_options(handle.get(), what.url, ca_path_);
            raw();
            what.make_result();
        };
        measure({std::string("`") + what.name + "`, kept connection", at_most, what.call, raw,
                 calls, reconnect});
        measure({"libcurl alone with options set anew, the pass, and what the interface demands",
                 no_figure, least, raw, calls, reconnect});
    }

    void measure_threads()
    {
        for (unsigned count : {2u, 4u, 8u}) {
            const std::string threads = std::to_string(count) + " threads beside 1";
            measure({"64 calls on " + threads, 1.05, [&, count] { on_threads(count, folder.call); },
                     [&] { on_threads(1, folder.call); }});
            auto alone = [&] { raw_exchange(folder.url, ca_path_); };
            measure({"64 times libcurl alone on " + threads, no_figure,
                     [&, count] { on_threads(count, alone); }, [&] { on_threads(1, alone); }});
        }
    }

    static void on_threads(unsigned count, const std::function<void()> &call)
    {
        std::vector<std::thread> threads;
        for (unsigned number = 0; number < count; ++number)
            threads.emplace_back([&, each = 64 / count] {
                for (unsigned turn = 0; turn < each; ++turn)
                    call();
            });
        for (std::thread &each : threads)
            each.join();
    }

    std::string base_;
    std::string one_certificate_;
    std::string bundle_;
    std::string ca_path_;

public:
    subject folder = {"get_folder_info", call_folder_info, make_folder_record, folder_record()};
    subject user = {"get_user_info", call_user_info, make_user_record, user_record()};
    subject content = {"get_folder_content", call_folder_content, make_listing, listing(1000)};
    subject changes = {"get_device_changes", call_device_changes, make_change_list,
                       change_feed(500)};
};

std::string kept_reply(const std::string &body)
{
    return "HTTP/1.1 200 OK\r\nContent-Type: text/xml\r\nContent-Length: " +
           std::to_string(body.size()) + "\r\n\r\n" + body;
}

// Static replies, made once: what the server costs is none of the client's.
std::function<std::string(const request &)> replies()
{
    return [folder = kept_reply(folder_record()), user = kept_reply(user_record()),
            content = kept_reply(listing(1000)),
            changes = kept_reply(change_feed(500))](const request &asked) {
        std::string path = asked.path();
        if (path == get_user_info_uri)
            return user;
        if (path == get_folder_content_uri)
            return content;
        return path == get_device_changes_uri ? changes : folder;
    };
}

} // namespace

int main(int argc, char **argv)
{
    if (argc != 2) {
        std::fprintf(stderr, "usage: request_bench BUNDLE\n");
        return 2;
    }
    quillmere_test::proxyless_environment environment;
    quillmere_test::unread_log log; // written all the same
    quillmere_test::temporary_folder folder;
    std::string root = quillmere_test::test_root_path();
    std::string bundle = folder.write("bundle.pem", quillmere_test::content_of(argv[1]) +
                                                        quillmere_test::content_of(root));

    // What was read from a file that changed a moment ago is not kept.
    std::this_thread::sleep_for(std::chrono::seconds(4));

    quick_server_process server(replies(),
                                quillmere_test::tls_with(quillmere_test::loopback_certificate()));
    bench(server.base_url(), root, bundle).run();
}
