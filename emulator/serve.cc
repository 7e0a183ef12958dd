#include "serve.h"

#include <csignal>
#include <ctime>
#include <iostream>

#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>

#include "certificates.h"
#include "http_server.h"
#include "ready_signal.h"
#include "router.h"
#include "store/content.h"
#include "store/database.h"
#include "uploads.h"

namespace emulator {
namespace {

namespace asio = boost::asio;

constexpr std::chrono::seconds farewell_time{2};

asio::ssl::context make_tls(const data_directory &data)
{
    asio::ssl::context tls(asio::ssl::context::tls_server);
    SSL_CTX_set_min_proto_version(tls.native_handle(), TLS1_2_VERSION);
    SSL_CTX_set_mode(tls.native_handle(), SSL_MODE_RELEASE_BUFFERS); // idle ones are many
    tls.use_certificate_chain_file(data.server_certificate().string());
    tls.use_private_key_file(data.server_key().string(), asio::ssl::context::pem);
    return tls;
}

void announce(const listening_at &where)
{
    std::cout << "root certificate: " << where.root_certificate.string() << '\n'
              << "https: " << where.https_url() << '\n'
              << "http: " << where.http_url() << std::endl;
}

} // namespace

void serve(const serve_settings &settings)
{
    const data_directory data(settings.data);
    const descriptor claim = data.claim();
    ready_signal ready(settings.ready_file, settings.ready_descriptor);
    ensure_certificates(data, std::time(nullptr));
    asio::ssl::context tls = make_tls(data);
    database store(data.store());
    content_store content(data.content());
    service state{store, content, [] { return std::int64_t{std::time(nullptr)}; },
                  settings.session_lifetime};

    asio::io_context context(1);
    http_server server(context, {},
                       {[&state](const request &asked) { return answer(asked, state); },
                        [&state](const request &asked) { return receive_upload(asked, state); }});
    asio::signal_set signals(context, SIGINT, SIGTERM);
    asio::steady_timer farewell(context);
    signals.async_wait([&](const boost::system::error_code &, int) {
        // A client that neither reads its reply nor leaves must not keep the program alive.
        farewell.expires_after(farewell_time);
        farewell.async_wait([&context](const boost::system::error_code &) { context.stop(); });
        server.stop([&farewell] { farewell.cancel(); });
    });

    const listening_at where{server.listen(settings.https_port, &tls),
                             server.listen(settings.http_port, nullptr), data.root_certificate()};
    announce(where);
    ready.give(where);
    context.run();
}

} // namespace emulator
