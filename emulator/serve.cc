#include "serve.h"

#include <csignal>
#include <ctime>
#include <iostream>
#include <optional>
#include <random>

#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>

#include "admin.h"
#include "certificates.h"
#include "faults.h"
#include "faulty_handlers.h"
#include "http_server.h"
#include "ready_signal.h"
#include "request_counts.h"
#include "router.h"
#include "server_tls.h"
#include "store/content.h"
#include "store/database.h"
#include "store/reset.h"
#include "uploads.h"

namespace emulator {
namespace {

namespace asio = boost::asio;

constexpr std::chrono::seconds farewell_time{2};

void announce(const listening_at &where)
{
    std::cout << "root certificate: " << where.root_certificate.string() << '\n'
              << "https: " << where.https_url() << '\n'
              << "http: " << where.http_url() << '\n';
    if (where.admin)
        std::cout << "admin: " << where.admin->http_url() << '\n';
    std::cout << std::flush;
}

asio::ssl::context &certificate_for(fault_list &faults, server_tls &tls)
{
    const fault *by = faults.strike_connection();
    return by ? tls.variant(by->which) : tls.sound();
}

std::optional<loopback_address> listen(http_server &admin, std::optional<loopback_address> at)
{
    if (at)
        at->port = admin.listen({asio::ip::make_address(at->host), at->port});
    return at;
}

} // namespace

void serve(const serve_settings &settings)
{
    const data_directory data(settings.data);
    const descriptor claim = data.claim();
    ready_signal ready(settings.ready_file, settings.ready_descriptor);
    ensure_certificates(data, std::time(nullptr));
    server_tls tls(data);
    if (settings.admin)
        tls.make_variants();
    database store(data.store());
    content_store content(data.content());
    service state{store, content, [] { return std::int64_t{std::time(nullptr)}; },
                  settings.session_lifetime};
    fault_list faults;
    request_counts requests;

    asio::io_context context(1);
    http_server server(
        context, {},
        with_faults({[&state](const request &asked) { return answer(asked, state); },
                     [&state](const request &asked) { return receive_upload(asked, state); }},
                    faults, requests));
    http_server admin(context, admin_limits(),
                      admin_handlers({faults, requests, [&] { reset_trees(store, content); },
                                      [] { return std::uint64_t{std::random_device()()}; }}));
    asio::signal_set signals(context, SIGINT, SIGTERM);
    asio::steady_timer farewell(context);
    signals.async_wait([&](const boost::system::error_code &, int) {
        // A client that neither reads its reply nor leaves must not keep the program alive.
        farewell.expires_after(farewell_time);
        farewell.async_wait([&context](const boost::system::error_code &) { context.stop(); });
        server.stop([&] { admin.stop([&farewell] { farewell.cancel(); }); });
    });

    const listening_at where{
        server.listen(settings.https_port,
                      [&]() -> asio::ssl::context & { return certificate_for(faults, tls); }),
        server.listen(settings.http_port, nullptr), data.root_certificate(),
        listen(admin, settings.admin)};
    announce(where);
    ready.give(where);
    context.run();
}

} // namespace emulator
