#include "outgoing_reply.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <limits>
#include <sstream>

#include <unistd.h>

#include <boost/beast/http/empty_body.hpp>
#include <boost/beast/http/message.hpp>
#include <boost/beast/http/write.hpp>

#include "times.h"

namespace emulator {
namespace {

namespace http = boost::beast::http;

constexpr std::size_t piece_length = 64 * 1024;

std::string head_of(const reply &made, unsigned http_version, bool keep_alive)
{
    http::response<http::empty_body> response;
    response.result(made.http_status);
    response.version(http_version);
    response.set(http::field::server, "quillmere-emulator");
    response.set(http::field::date, http_date(std::time(nullptr)));
    response.set(http::field::content_type, "text/xml; charset=utf-8");
    response.set(http::field::cache_control, "no-store");
    if (response.result() == http::status::method_not_allowed)
        response.set(http::field::allow, "GET, HEAD, POST");
    for (const header_field &each : made.fields)
        response.set(each.name, each.value);
    response.keep_alive(keep_alive);
    response.content_length(made.file ? made.file->length : made.body.size());
    std::ostringstream text;
    text << response.base();
    return text.str();
}

} // namespace

outgoing_reply::outgoing_reply(reply made, unsigned http_version, bool keep_alive, body what)
    : piece_(head_of(made, http_version, keep_alive)),
      is_cut_(made.sending.kind == delivery_kind::cut)
{
    left_ = is_cut_ ? made.sending.cut_after : std::numeric_limits<std::uint64_t>::max();
    if (what == body::left_out)
        return;
    if (made.file)
        file_ = std::move(*made.file);
    else
        piece_ += made.body;
}

std::string_view outgoing_reply::next_piece(boost::system::error_code &problem)
{
    problem = {};
    if (is_begun_)
        piece_.clear();
    is_begun_ = true;
    if (file_.length > 0)
        append_file(problem);
    const std::string_view piece = std::string_view(piece_).substr(0, left_);
    left_ -= piece.size();
    return piece;
}

void outgoing_reply::append_file(boost::system::error_code &problem)
{
    const std::size_t begin = piece_.size();
    const std::size_t wanted = std::min<std::uint64_t>(piece_length, file_.length);
    piece_.resize(begin + wanted);
    const ssize_t got = ::pread(file_.file->number(), piece_.data() + begin, wanted,
                                static_cast<off_t>(file_.offset));
    const std::size_t length = got > 0 ? static_cast<std::size_t>(got) : 0;
    if (length == 0)
        problem = {got < 0 ? errno : EIO, boost::system::system_category()};
    piece_.resize(begin + length);
    file_.offset += length;
    file_.length -= length;
}

} // namespace emulator
