// One client's connection: reads requests, answers them, one after another.
#pragma once

#include <array>
#include <limits>
#include <optional>
#include <type_traits>

#include <boost/asio/ssl/stream.hpp>
#include <boost/beast/core.hpp>
#include <boost/beast/http.hpp>
#include <boost/beast/ssl.hpp>

#include "envelope.h"
#include "errors.h"
#include "file_body.h"
#include "http_server.h"
#include "received_body.h"
#include "request_fields.h"

namespace emulator {

namespace beast = boost::beast;
namespace http = boost::beast::http;

/** What the server needs of a connection. */
class open_connection {
public:
    virtual ~open_connection() = default;
    /** Ends it now if it is idle, or else behind the reply that is under way. */
    virtual void stop() = 0;
};

/** What a connection needs of the server. */
struct connection_host {
    const server_limits &limits;
    const request_handlers &handlers;
    std::function<void(open_connection *)> closed;
};

/** @tparam Stream beast::tcp_stream, or the same inside beast::ssl_stream */
template <class Stream>
class connection : public open_connection, public std::enable_shared_from_this<connection<Stream>> {
public:
    connection(Stream stream, connection_host host)
        : stream_(std::move(stream)), host_(std::move(host)), buffer_(host_.limits.header_bytes * 2)
    {
    }
    ~connection() override { host_.closed(this); }

    void start()
    {
        if constexpr (is_tls) {
            allow(host_.limits.exchange_time);
            stream_.async_handshake(boost::asio::ssl::stream_base::server,
                                    [self = this->shared_from_this()](beast::error_code problem) {
                                        if (!problem)
                                            self->read_header();
                                    });
        } else {
            read_header();
        }
    }

    void stop() override
    {
        stopping_ = true;
        if (!owes_reply_)
            socket_layer().close();
    }

private:
    static constexpr std::size_t upload_piece = 64 * 1024; // read in one go
    static constexpr bool is_tls = !std::is_same_v<Stream, beast::tcp_stream>;
    using self_pointer = std::shared_ptr<connection>;
    using header_parser = http::request_parser<http::empty_body>;
    using body_parser = http::request_parser<http::string_body>;
    using upload_parser = http::request_parser<received_body>;

    beast::tcp_stream &socket_layer() { return beast::get_lowest_layer(stream_); }
    void allow(std::chrono::seconds time) { socket_layer().expires_after(time); }

    // The header comes first and alone, so that what follows can depend on it.
    void read_header()
    {
        owes_reply_ = false;
        is_head_ = false;
        if (stopping_)
            return socket_layer().close(); // nothing is unread, so the reply arrives all the same
        header_.emplace();
        header_->header_limit(host_.limits.header_bytes);
        // Judged when the body is read, or by its receiver. ("None" would refuse every body in this
        // version.)
        header_->body_limit(std::numeric_limits<std::uint64_t>::max());
        allow(host_.limits.idle_time);
        http::async_read_header(
            stream_, buffer_, *header_,
            [self = this->shared_from_this()](beast::error_code problem, std::size_t) {
                self->owes_reply_ = true;
                problem ? self->read_failed(problem) : self->header_read();
            });
    }

    void header_read()
    {
        allow(host_.limits.exchange_time);
        const auto &header = header_->get();
        request asked = request_of(header, origin(header[http::field::host]));
        if (const auto length = header_->content_length())
            asked.content_length = *length;
        is_head_ = asked.method == "HEAD";
        receiver_ = host_.handlers.receive(asked);
        receiver_ ? expect_upload() : expect_body();
    }

    void expect_body()
    {
        body_.emplace(std::move(*header_));
        body_->body_limit(host_.limits.body_bytes);
        const auto length = body_->content_length();
        if (length && *length > host_.limits.body_bytes)
            return refuse_and_close(refuse(refusal(error::request_too_large)));
        invited(body_->get(), [this] { read_body(); });
    }

    void expect_upload()
    {
        if (receiver_->is_refused())
            return refuse_upload();
        upload_.emplace(std::move(*header_), receiver_.get());
        buffer_.reserve(upload_piece);
        invited(upload_->get(), [this] { read_upload(); });
    }

    // Reads what follows the header, once a client that waits to be asked for it has been asked.
    template <class Message, class Read> void invited(const Message &message, Read read)
    {
        static constexpr char invitation[] = "HTTP/1.1 100 Continue\r\n\r\n";
        if (!beast::iequals(message[http::field::expect], "100-continue"))
            return read();
        boost::asio::async_write(
            stream_, boost::asio::buffer(invitation, sizeof invitation - 1),
            [self = this->shared_from_this(), read](beast::error_code problem, std::size_t) {
                if (!problem)
                    read();
            });
    }

    void read_body()
    {
        http::async_read(stream_, buffer_, *body_,
                         [self = this->shared_from_this()](beast::error_code problem, std::size_t) {
                             problem ? self->read_failed(problem) : self->respond();
                         });
    }

    // Each piece has its own time, as it has when a file is sent.
    void read_upload()
    {
        if (upload_->is_done())
            return upload_read();
        allow(host_.limits.exchange_time);
        http::async_read_some(
            stream_, buffer_, *upload_,
            [self = this->shared_from_this()](beast::error_code problem, std::size_t) {
                if (self->receiver_->is_refused())
                    return self->refuse_upload();
                problem ? self->upload_cut(problem) : self->read_upload();
            });
    }

    void upload_read()
    {
        const bool keep_alive = upload_->get().keep_alive() && !stopping_;
        const unsigned version = upload_->get().version();
        upload_.reset();
        write(std::exchange(receiver_, nullptr)->answer(), version, keep_alive);
        buffer_.shrink_to_fit();
    }

    // What came of it goes at once, not when the client has left.
    void refuse_upload() { refuse_and_close(std::exchange(receiver_, nullptr)->answer()); }

    void upload_cut(beast::error_code problem)
    {
        receiver_.reset();
        read_failed(problem);
    }

    void respond()
    {
        http::request<http::string_body> message = body_->release();
        request asked = request_of(message, origin(message[http::field::host]));
        asked.body = std::move(message.body());
        write(host_.handlers.answer(asked), message.version(), message.keep_alive() && !stopping_);
    }

    std::string origin(beast::string_view host)
    {
        beast::error_code problem;
        const auto here = socket_layer().socket().local_endpoint(problem);
        return origin_of(is_tls ? "https://" : "http://", host, here.port());
    }

    // A client that breaks the protocol is told so, if it can still listen, and left.
    void read_failed(beast::error_code problem)
    {
        if (problem == http::error::header_limit || problem == http::error::buffer_overflow)
            return refuse_and_close(refuse(refusal(error::request_too_large, "header")));
        if (problem == http::error::body_limit)
            return refuse_and_close(refuse(refusal(error::request_too_large)));
        const bool is_protocol_fault =
            problem.category() == make_error_code(http::error::bad_method).category();
        if (is_protocol_fault && problem != http::error::end_of_stream &&
            problem != http::error::partial_message)
            return refuse_and_close(refuse(refusal(error::malformed_request, problem.message())));
        close();
    }

    void refuse_and_close(const reply &refused) { write(refused, 11, false); }

    void write(reply made, unsigned version, bool keep_alive)
    {
        keep_alive_ = keep_alive;
        if (made.file)
            return write_file(std::move(made), version);
        response_ = {};
        begin(response_, made, version);
        response_.content_length(made.body.size());
        if (!is_head_)
            response_.body() = std::move(made.body);
        allow(host_.limits.exchange_time);
        http::async_write(stream_, response_,
                          [self = this->shared_from_this()](beast::error_code problem,
                                                            std::size_t) { self->sent(problem); });
    }

    template <class Response> void begin(Response &response, const reply &made, unsigned version)
    {
        response.result(http::status(made.http_status));
        response.version(version);
        response.set(http::field::server, "quillmere-emulator");
        response.set(http::field::content_type, "text/xml; charset=utf-8");
        response.set(http::field::cache_control, "no-store");
        if (response.result() == http::status::method_not_allowed)
            response.set(http::field::allow, "GET, HEAD, POST");
        for (const header_field &each : made.fields)
            response.set(each.name, each.value);
        response.keep_alive(keep_alive_);
    }

    void write_file(reply made, unsigned version)
    {
        file_response_.emplace();
        begin(*file_response_, made, version);
        file_response_->content_length(made.file->length);
        file_response_->body() = *made.file;
        if (is_head_)
            file_response_->body().length = 0;
        file_writer_.emplace(*file_response_);
        write_piece();
    }

    // Each piece has its own time: a large file may take long, a client that stalls may not.
    void write_piece()
    {
        allow(host_.limits.exchange_time);
        http::async_write_some(
            stream_, *file_writer_,
            [self = this->shared_from_this()](beast::error_code problem, std::size_t) {
                if (!problem && !self->file_writer_->is_done())
                    return self->write_piece();
                self->file_writer_.reset();
                self->file_response_.reset();
                self->sent(problem);
            });
    }

    void sent(beast::error_code problem)
    {
        if (problem || !keep_alive_)
            return close();
        read_header();
    }

    void close()
    {
        owes_reply_ = false;
        allow(host_.limits.exchange_time);
        if constexpr (is_tls)
            stream_.async_shutdown(
                [self = this->shared_from_this()](beast::error_code) { self->drain(); });
        else
            drain();
    }

    // Reads on until the client has closed too. To close while bytes of it are still unread would
    // reset the connection, and the client might lose the reply that tells it what was wrong.
    void drain()
    {
        beast::error_code ignored;
        socket_layer().socket().shutdown(boost::asio::ip::tcp::socket::shutdown_send, ignored);
        drain_more();
    }

    void drain_more()
    {
        socket_layer().async_read_some(
            boost::asio::buffer(discarded_),
            [self = this->shared_from_this()](beast::error_code problem, std::size_t got) {
                self->drained_ += got;
                if (!problem && self->drained_ < self->host_.limits.body_bytes)
                    self->drain_more();
            });
    }

    Stream stream_;
    connection_host host_;
    beast::flat_buffer buffer_;
    std::optional<header_parser> header_;
    std::optional<body_parser> body_;
    std::unique_ptr<body_receiver> receiver_; // of an upload that is under way
    std::optional<upload_parser> upload_;
    http::response<http::string_body> response_;
    std::optional<http::response<part_of_file>> file_response_;
    std::optional<http::response_serializer<part_of_file>> file_writer_;
    std::array<char, 4096> discarded_{};
    std::uint64_t drained_ = 0;
    bool owes_reply_ = false;
    bool is_head_ = false;
    bool keep_alive_ = false;
    bool stopping_ = false;
};

} // namespace emulator
