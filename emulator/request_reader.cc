#include "request_reader.h"

#include <limits>
#include <optional>
#include <utility>

#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/read_size.hpp>
#include <boost/beast/core/string.hpp>
#include <boost/beast/http/empty_body.hpp>
#include <boost/beast/http/error.hpp>
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/string_body.hpp>

#include "received_body.h"
#include "request_fields.h"

namespace emulator {
namespace {

namespace beast = boost::beast;
namespace http = boost::beast::http;

constexpr std::size_t upload_piece = 64 * 1024; // read in one go

using header_parser = http::request_parser<http::empty_body>;
using body_parser = http::request_parser<http::string_body>;
using upload_parser = http::request_parser<received_body>;

// The parser itself stops behind the header, unless it is eager.
template <class Parser> bool is_complete(const Parser &parser) { return parser.is_done(); }
bool is_complete(const header_parser &parser) { return parser.is_header_done(); }

template <class Parser> beast::error_code parse_with(Parser &parser, beast::flat_buffer &buffer)
{
    beast::error_code problem;
    while (!problem && !is_complete(parser)) {
        if (buffer.size() == 0)
            return http::error::need_more;
        buffer.consume(parser.put(buffer.data(), problem));
    }
    return problem;
}

template <class Parser> beast::error_code end_with(Parser &parser)
{
    if (!parser.got_some())
        return http::error::end_of_stream;
    beast::error_code problem;
    parser.put_eof(problem);
    return problem;
}

} // namespace

struct request_reader::parts {
    explicit parts(const server_limits &with) : limits(with), buffer(with.header_bytes * 2) {}

    template <class Use> beast::error_code with_parser(Use use)
    {
        if (upload)
            return use(*upload);
        return body ? use(*body) : use(*head);
    }

    server_limits limits;
    beast::flat_buffer buffer;
    std::optional<header_parser> head; // then one of the others in place of it
    std::optional<body_parser> body;
    std::optional<upload_parser> upload;
    bool awaits_invitation = false;
    bool keeps_alive = false;
    unsigned http_version = 11;
};

request_reader::request_reader(const server_limits &limits) : parts_(new parts(limits)) {}

request_reader::~request_reader() = default;

void request_reader::expect_header()
{
    parts_->body.reset();
    parts_->upload.reset();
    parts_->awaits_invitation = parts_->keeps_alive = false;
    parts_->http_version = 11;
    header_parser &parser = parts_->head.emplace();
    parser.header_limit(parts_->limits.header_bytes);
    // Judged when the body is read, or by its receiver. ("None" would refuse every body in this
    // version.)
    parser.body_limit(std::numeric_limits<std::uint64_t>::max());
}

void request_reader::expect_body()
{
    body_parser &parser = parts_->body.emplace(std::move(*parts_->head));
    parser.body_limit(parts_->limits.body_bytes);
    parser.eager(true);
}

void request_reader::expect_upload(body_receiver &receiver)
{
    upload_parser &parser = parts_->upload.emplace(std::move(*parts_->head), &receiver);
    parser.eager(true);
    parts_->buffer.reserve(upload_piece);
}

request_reader::error_code request_reader::parse()
{
    return parts_->with_parser([this](auto &parser) { return parse_with(parser, parts_->buffer); });
}

boost::asio::mutable_buffer request_reader::room()
{
    return parts_->buffer.prepare(beast::read_size(parts_->buffer, upload_piece));
}

void request_reader::arrived(std::size_t count) { parts_->buffer.commit(count); }

request_reader::error_code request_reader::end()
{
    return parts_->with_parser([](auto &parser) { return end_with(parser); });
}

request request_reader::head(const std::string &scheme, std::uint16_t port)
{
    const auto &header = parts_->head->get();
    parts_->awaits_invitation = beast::iequals(header[http::field::expect], "100-continue");
    parts_->keeps_alive = header.keep_alive();
    parts_->http_version = header.version();
    request asked = request_of(header, origin_of(scheme, header[http::field::host], port));
    if (const auto length = parts_->head->content_length())
        asked.content_length = *length;
    return asked;
}

std::string request_reader::take_body() { return std::move(parts_->body->get().body()); }

bool request_reader::awaits_invitation() const { return parts_->awaits_invitation; }

bool request_reader::keeps_alive() const { return parts_->keeps_alive; }

unsigned request_reader::http_version() const { return parts_->http_version; }

void request_reader::shrink() { parts_->buffer.shrink_to_fit(); }

bool request_reader::is_unfinished(const error_code &problem)
{
    return problem == http::error::need_more;
}

bool request_reader::is_header_too_large(const error_code &problem)
{
    return problem == http::error::header_limit || problem == http::error::buffer_overflow;
}

bool request_reader::is_body_too_large(const error_code &problem)
{
    return problem == http::error::body_limit;
}

bool request_reader::is_protocol_fault(const error_code &problem)
{
    return problem.category() == make_error_code(http::error::bad_method).category() &&
           problem != http::error::end_of_stream && problem != http::error::partial_message;
}

} // namespace emulator
