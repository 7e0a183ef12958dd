#include "exchange_watch.h"

#include <algorithm>
#include <charconv>
#include <iterator>

#include "text.h"

namespace quillmere::tools {

namespace {

// Enough to get past an XML declaration and a comment or two to the first element.
constexpr std::size_t body_kept = 2048;
constexpr std::size_t line_kept = 1024;
constexpr std::string_view error_beginning = "cUrl error: (";
constexpr int libcurl_timed_out = 28; // of libcurl

std::optional<int> take_code(std::string_view &line)
{
    int code = 0;
    const auto [end, problem] = std::from_chars(line.data(), line.data() + line.size(), code);
    if (problem != std::errc())
        return std::nullopt;
    line.remove_prefix(static_cast<std::size_t>(end - line.data()));
    return code;
}

// "cUrl error: (code) general reason: particular reason", where the last may be empty.
std::optional<transfer_error> read_exchange_error(std::string_view line)
{
    if (!starts_with(line, error_beginning))
        return std::nullopt;
    line.remove_prefix(error_beginning.size());
    const auto code = take_code(line);
    if (!code || !starts_with(line, ") "))
        return std::nullopt;
    line.remove_prefix(2);
    const std::size_t colon = line.find(": ");
    const std::string_view particular =
        colon == std::string_view::npos ? std::string_view() : trimmed(line.substr(colon + 2));
    return transfer_error{*code,
                          std::string(particular.empty() ? line.substr(0, colon) : particular)};
}

// "Curl error: reason" when connecting fails, "Error: code reason" when sending or receiving does,
// "Error: ... timeout." when nothing moves; other lines that begin so are no failures.
std::optional<transfer_error> read_upload_error(std::string_view line)
{
    constexpr std::string_view connecting = "Curl error: ";
    constexpr std::string_view moving = "Error: ";
    if (starts_with(line, connecting))
        return transfer_error{0, std::string(line.substr(connecting.size()))};
    if (!starts_with(line, moving))
        return std::nullopt;
    line.remove_prefix(moving.size());
    if (ends_with(line, "timeout."))
        return transfer_error{libcurl_timed_out, "nothing moved for 60 seconds"};
    const auto code = take_code(line);
    if (!code)
        return std::nullopt;
    return transfer_error{*code, std::string(trimmed(line))};
}

std::optional<transfer_error> read_error(std::string_view line)
{
    const auto error = read_exchange_error(line);
    return error ? error : read_upload_error(line);
}

// Skips blanks, and what may stand before the first element of an XHTML page.
std::string_view from_first_tag(std::string_view body)
{
    const std::string_view byte_order_mark = "\xef\xbb\xbf";
    if (starts_with(body, byte_order_mark))
        body.remove_prefix(byte_order_mark.size());
    for (;;) {
        body = trimmed(body);
        const bool declaration = starts_with(body, "<?");
        const bool comment = starts_with(body, "<!--");
        if (!declaration && !comment)
            return body;
        const std::string_view closing = declaration ? "?>" : "-->";
        const std::size_t end = body.find(closing);
        if (end == std::string_view::npos)
            return {};
        body.remove_prefix(end + closing.size());
    }
}

} // namespace

void exchange_watch::begin()
{
    in_body_ = false;
    line_.clear();
    body_.clear();
    error_.reset();
}

void exchange_watch::feed(std::string_view piece)
{
    for (const char letter : piece) {
        if (in_body_) {
            if (body_.size() < body_kept)
                body_ += letter;
        } else if (letter == '\n') {
            end_line();
        } else if (line_.size() < line_kept) {
            line_ += letter;
        }
    }
}

void exchange_watch::end_line()
{
    // Nothing behind this line is read as the transport's words: they are the service's.
    in_body_ = line_ == "Got text:" || line_ == "Got response:";
    if (const auto error = read_error(line_))
        error_ = error;
    line_.clear();
}

std::string_view exchange_watch::body_beginning() const
{
    return body_ == "(null)\n" ? std::string_view() : std::string_view(body_);
}

bool looks_like_html(std::string_view body_beginning)
{
    const std::string beginning = lower_case(from_first_tag(body_beginning).substr(0, 32));
    constexpr std::string_view signs[] = {"<!doctype html", "<html",   "<head", "<body",
                                          "<title",         "<script", "<meta"};
    return std::any_of(std::begin(signs), std::end(signs),
                       [&](std::string_view sign) { return starts_with(beginning, sign); });
}

} // namespace quillmere::tools
