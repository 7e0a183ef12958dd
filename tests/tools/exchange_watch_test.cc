// What is read in the library's log: the transport's error, the beginning of the body.
#include "exchange_watch.h"

#include <string>
#include <string_view>

#include <gtest/gtest.h>

namespace quillmere_test {
namespace {

using quillmere::tools::exchange_watch;
using quillmere::tools::looks_like_html;

constexpr std::string_view failed_exchange =
    "get_system_status url: https://h/p\n"
    "cUrl error: (60) SSL peer certificate was not OK: unable to get local issuer\n"
    "Got text:\n(null)\n";
constexpr std::string_view answered_exchange = "Session token url:\nhttps://h/p\n"
                                               "Got text:\n<html>\n</html>\nText len: 5\n";

TEST(ExchangeWatch, ReadsTheParticularReasonOfAFailedTransfer)
{
    exchange_watch watch;

    watch.feed(failed_exchange);

    ASSERT_TRUE(watch.error().has_value());
    EXPECT_EQ(watch.error()->code, 60);
    EXPECT_EQ(watch.error()->text, "unable to get local issuer");
    EXPECT_EQ(watch.body_beginning(), "");
}

TEST(ExchangeWatch, TakesTheGeneralReasonWhereThereIsNoOther)
{
    exchange_watch watch;

    watch.feed("cUrl error: (28) Timeout was reached: \n");

    ASSERT_TRUE(watch.error().has_value());
    EXPECT_EQ(watch.error()->text, "Timeout was reached");
}

TEST(ExchangeWatch, ReadsWhatTheUploadConnectionSays)
{
    const struct {
        std::string_view line;
        int code;
        const char *text;
    } rows[] = {
        {"Curl error: Couldn't connect to server\n", 0, "Couldn't connect to server"},
        {"Error: 55 Failed sending data to the peer\n", 55, "Failed sending data to the peer"},
        {"Error: Connection timeout.\n", 28, "nothing moved for 60 seconds"},
        {"Error: Transmission timeout.\n", 28, "nothing moved for 60 seconds"},
    };
    for (const auto &row : rows) {
        exchange_watch watch;
        watch.feed(row.line);
        ASSERT_TRUE(watch.error().has_value()) << row.line;
        EXPECT_EQ(watch.error()->code, row.code);
        EXPECT_EQ(watch.error()->text, row.text);
    }

    exchange_watch patient;
    patient.feed("Error: wait_on_socket failed.\n");
    EXPECT_FALSE(patient.error().has_value()) << "it is tried again";
}

TEST(ExchangeWatch, KeepsTheBeginningOfTheBody)
{
    exchange_watch watch;

    watch.feed(answered_exchange);

    EXPECT_FALSE(watch.error().has_value());
    EXPECT_EQ(watch.body_beginning().substr(0, 6), "<html>");
}

TEST(ExchangeWatch, SeesTheSameWhereverItsInputIsCut)
{
    for (const std::string_view text : {failed_exchange, answered_exchange}) {
        exchange_watch whole;
        whole.feed(text);
        for (size_t cut = 0; cut <= text.size(); ++cut) {
            exchange_watch watch;
            watch.feed(text.substr(0, cut));
            watch.feed(text.substr(cut));
            ASSERT_EQ(watch.body_beginning(), whole.body_beginning()) << cut;
            ASSERT_EQ(watch.error().has_value(), whole.error().has_value()) << cut;
        }
    }
}

TEST(ExchangeWatch, DoesNotTakeTheServicesWordsForTheTransports)
{
    exchange_watch watch;

    watch.feed("Got text:\nhello\ncUrl error: (60) not: so\n");

    EXPECT_FALSE(watch.error().has_value());
}

TEST(ExchangeWatch, IgnoresLinesThatOnlyResembleAnError)
{
    for (const char *line : {"cUrl error: (x) a: b\n", "cUrl error: (6\n", "cUrl error:\n",
                             " cUrl error: (6) a: b\n", "cUrl error: (6)a: b\n"}) {
        exchange_watch watch;
        watch.feed(line);
        EXPECT_FALSE(watch.error().has_value()) << line;
    }
}

TEST(ExchangeWatch, ForgetsTheExchangeBefore)
{
    exchange_watch watch;
    watch.feed(failed_exchange);
    watch.begin();

    watch.feed(answered_exchange);

    EXPECT_FALSE(watch.error().has_value());
}

TEST(ExchangeWatch, KeepsNoMoreThanItNeedsOfALongBody)
{
    exchange_watch watch;

    watch.feed("Got text:\n" + std::string(1'000'000, 'a'));

    EXPECT_LE(watch.body_beginning().size(), 4096U);
}

TEST(HtmlPage, IsRecognisedByItsFirstElement)
{
    for (const char *page :
         {"<html>", "<HTML lang=\"en\">", "<!DOCTYPE html><title>x", "<!doctype HTML PUBLIC \"x\">",
          "\xef\xbb\xbf<html>", " \r\n\t<html>", "<?xml version=\"1.0\"?>\n<!DOCTYPE html>",
          "<!-- a --><!-- b -->\n<html>", "<head>", "<body>", "<title>", "<meta a>", "<script>"})
        EXPECT_TRUE(looks_like_html(page)) << page;
}

TEST(HtmlPage, IsNotSeenInAnythingElse)
{
    for (const char *other :
         {"", " ", "<response><html/></response>", "<?xml version=\"1.0\"?><response/>", "<htm",
          "html", "<!-- <html> -->", "<!-- <html>", "{\"html\": 1}", "<?xml <html>",
          "<!DOCTYPE response><response/>"})
        EXPECT_FALSE(looks_like_html(other)) << other;
}

} // namespace
} // namespace quillmere_test
