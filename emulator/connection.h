// One client's connection: reads requests, answers them, one after another.
#pragma once

#include <array>
#include <chrono>
#include <limits>
#include <memory>
#include <optional>
#include <string_view>
#include <type_traits>

#include <boost/asio/buffer.hpp>
#include <boost/asio/error.hpp>
#include <boost/asio/ssl/stream.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/write.hpp>
#include <boost/beast/core/error.hpp>
#include <boost/beast/core/stream_traits.hpp>
#include <boost/beast/core/tcp_stream.hpp>

#include "errors.h"
#include "http_server.h"
#include "outgoing_reply.h"
#include "request_reader.h"

namespace emulator {

namespace beast = boost::beast;

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

/** @tparam Stream beast::tcp_stream, or the same inside asio::ssl::stream */
template <class Stream>
class connection : public open_connection, public std::enable_shared_from_this<connection<Stream>> {
public:
    /** @param parts what the stream is made of */
    template <class... Parts>
    explicit connection(connection_host host, Parts &&...parts)
        : stream_(std::forward<Parts>(parts)...), host_(std::move(host)), reader_(host_.limits),
          pause_(stream_.get_executor())
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
        pause_.cancel();
        if (!owes_reply_)
            socket_layer().close();
    }

private:
    static constexpr bool is_tls = !std::is_same_v<Stream, beast::tcp_stream>;

    beast::tcp_stream &socket_layer() { return beast::get_lowest_layer(stream_); }
    void allow(std::chrono::seconds time) { socket_layer().expires_after(time); }

    void read_header()
    {
        owes_reply_ = false;
        asked_ = {};
        if (stopping_)
            return socket_layer().close(); // nothing is unread, so the reply arrives all the same
        reader_.expect_header();
        await(&connection::header_read, host_.limits.idle_time);
    }

    // Reads until what the reader expects is there, or cannot come any more.
    void await(void (connection::*then)(), std::chrono::seconds time)
    {
        then_ = then;
        allow(time);
        proceed(reader_.parse());
    }

    void proceed(beast::error_code problem)
    {
        if (!request_reader::is_unfinished(problem))
            return arrived(problem);
        if (receiver_)
            allow(host_.limits.exchange_time); // each piece has its own, as when a file is sent
        const boost::asio::mutable_buffer room = reader_.room();
        if (room.size() == 0)
            return refuse_large("header");
        stream_.async_read_some(
            room, [self = this->shared_from_this()](beast::error_code ended, std::size_t count) {
                self->reader_.arrived(count);
                if (ended == boost::asio::error::eof)
                    return self->arrived(self->reader_.end());
                ended ? self->arrived(ended) : self->proceed(self->reader_.parse());
            });
    }

    void arrived(beast::error_code problem)
    {
        owes_reply_ = true;
        if (receiver_ && receiver_->is_refused())
            return refuse_upload();
        if (problem)
            return read_failed(problem);
        (this->*then_)();
    }

    void header_read()
    {
        allow(host_.limits.exchange_time);
        asked_ = reader_.head(is_tls ? "https://" : "http://", local_port());
        receiver_ = host_.handlers.receive(asked_);
        receiver_ ? expect_upload() : expect_body();
    }

    void expect_body()
    {
        if (asked_.content_length.value_or(0) > host_.limits.body_bytes)
            return refuse_large("");
        reader_.expect_body();
        invite(&connection::respond);
    }

    void expect_upload()
    {
        if (receiver_->is_refused())
            return refuse_upload();
        reader_.expect_upload(*receiver_);
        invite(&connection::upload_read);
    }

    // Reads what follows the header, once a client that waits to be asked for it has been asked.
    void invite(void (connection::*then)())
    {
        static constexpr std::string_view invitation = "HTTP/1.1 100 Continue\r\n\r\n";
        if (!reader_.awaits_invitation())
            return await(then, host_.limits.exchange_time);
        boost::asio::async_write(
            stream_, boost::asio::buffer(invitation),
            [self = this->shared_from_this(), then](beast::error_code problem, std::size_t) {
                if (!problem)
                    self->await(then, self->host_.limits.exchange_time);
            });
    }

    void upload_read()
    {
        write(std::exchange(receiver_, nullptr)->answer(), reader_.keeps_alive());
        reader_.shrink();
    }

    // What came of it goes at once, not when the client has left.
    void refuse_upload() { refuse_and_close(std::exchange(receiver_, nullptr)->answer()); }

    void respond()
    {
        asked_.body = reader_.take_body();
        write(host_.handlers.answer(asked_), reader_.keeps_alive());
    }

    std::uint16_t local_port()
    {
        beast::error_code problem;
        return socket_layer().socket().local_endpoint(problem).port();
    }

    // A client that breaks the protocol is told so, if it can still listen, and left.
    void read_failed(beast::error_code problem)
    {
        receiver_.reset();
        if (request_reader::is_header_too_large(problem))
            return refuse_large("header");
        if (request_reader::is_body_too_large(problem))
            return refuse_large("");
        if (request_reader::is_protocol_fault(problem))
            return refuse_and_close(
                host_.handlers.refuse(refusal(error::malformed_request, problem.message())));
        close();
    }

    void refuse_large(const std::string &part)
    {
        refuse_and_close(host_.handlers.refuse(refusal(error::request_too_large, part)));
    }

    void refuse_and_close(reply refused) { write(std::move(refused), false); }

    void write(reply made, bool keep_alive)
    {
        keep_alive_ = keep_alive && !stopping_;
        const delivery how = made.sending;
        using body = outgoing_reply::body;
        outgoing_.emplace(std::move(made), reader_.http_version(), keep_alive_,
                          asked_.method == "HEAD" ? body::left_out : body::sent);
        if (how.kind == delivery_kind::withheld)
            return withhold();
        if (how.kind == delivery_kind::reset)
            return tear_down();
        if (how.delay.count() > 0 && !stopping_)
            return write_later(how.delay);
        write_piece();
    }

    // Or at once when the server stops: then every reply under way is finished.
    void write_later(std::chrono::milliseconds delay)
    {
        pause_.expires_after(delay);
        pause_.async_wait(
            [self = this->shared_from_this()](beast::error_code) { self->write_piece(); });
    }

    // The connection stays until the client leaves or the server stops.
    void withhold()
    {
        owes_reply_ = false;
        socket_layer().expires_never();
        drain_limit_ = std::numeric_limits<std::uint64_t>::max();
        drain_more();
    }

    // Closed in this way the socket tells the client so by a reset.
    void tear_down()
    {
        beast::error_code ignored;
        socket_layer().socket().set_option(boost::asio::socket_base::linger(true, 0), ignored);
        socket_layer().close();
    }

    // Each piece has its own time: a large file may take long, a client that stalls may not.
    void write_piece()
    {
        if (outgoing_->is_done())
            return break_off(); // cut ahead of its first byte
        allow(host_.limits.exchange_time);
        beast::error_code broken;
        const std::string_view piece = outgoing_->next_piece(broken);
        boost::asio::async_write(
            stream_, boost::asio::buffer(piece),
            [self = this->shared_from_this(), broken](beast::error_code problem, std::size_t) {
                if (!problem && !broken && !self->outgoing_->is_done())
                    return self->write_piece();
                self->outgoing_->is_cut() ? self->break_off()
                                          : self->sent(problem ? problem : broken);
            });
    }

    // Over TLS without its farewell, as when a server dies.
    void break_off()
    {
        owes_reply_ = false;
        allow(host_.limits.exchange_time);
        drain();
    }

    void sent(beast::error_code problem)
    {
        outgoing_.reset();
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
        drain_limit_ = host_.limits.body_bytes;
        socket_layer().socket().shutdown(boost::asio::ip::tcp::socket::shutdown_send, ignored);
        drain_more();
    }

    void drain_more()
    {
        socket_layer().async_read_some(
            boost::asio::buffer(discarded_),
            [self = this->shared_from_this()](beast::error_code problem, std::size_t got) {
                self->drained_ += got;
                if (!problem && self->drained_ < self->drain_limit_)
                    self->drain_more();
            });
    }

    Stream stream_;
    connection_host host_;
    request_reader reader_;
    void (connection::*then_)() = nullptr; // once what is awaited is there
    request asked_{};
    std::unique_ptr<body_receiver> receiver_; // of an upload that is under way
    std::optional<outgoing_reply> outgoing_;
    boost::asio::steady_timer pause_; // ahead of a reply
    std::array<char, 4096> discarded_{};
    std::uint64_t drained_ = 0;
    std::uint64_t drain_limit_ = 0;
    bool owes_reply_ = false;
    bool keep_alive_ = false;
    bool stopping_ = false;
};

} // namespace emulator
