// The skeleton that every operation runs on. An operation composes its URL, fetches, asks whether
// the service accepted, looks up what it wants and returns the status; its peculiarities are
// arguments with names, or plain statements.
#pragma once

#include <cstdlib>

#include "owned.h"
#include "records/elements.h"
#include "records/records.h"
#include "xml/reply_reader.h"

namespace quillmere {

// How the reply is logged.
enum class reply_log {
    none,
    text,
    response, // the same under another heading
    text_and_length,
    text_and_int_length, // the length as a signed int
};

// What a failed exchange amounts to: no reply text, or a reply without a result.
enum class exchange_verdict {
    with_message,      // no code or a code, with a message that says so
    silent,            // the same, without a message
    silent_unless_zero // without a message; a missing reply with a code below zero counts as one
                       // with a code
};

// How the error number and message of a refusal are read.
enum class error_reading {
    standard, // get_error_from_xml()
    direct    // by the names of the elements, and a missing number is -1
};

// What every reply is asked for, by the way in which errors are read.
inline constexpr const char *standard_elements[] = {"result", "/error", "/message"};
inline constexpr const char *direct_elements[] = {"result", "error", "message"};

class api_call {
public:
    // Starts the URL with the TLS base and the path, and resets the error message.
    api_call(const char *path, char **error_message);

    void text(const char *text);

    // Each appends a key, with its punctuation, and a value.
    void plain(const char *key, const char *value);
    void encoded(const char *key, const char *value);
    void secret(const char *key, const char *value); // encoded, and left out of the log
    void number(const char *key, uint64_t value);
    void version();

    // What an operation looks up, and which list it extracts. All of that is read in one pass over
    // the reply, as long as nothing is wrong with the reply; whatever is not expected, or is asked
    // for again, costs a pass of its own. An operation that expects nothing still expects a result.
    template <size_t count>
    void expect(const element_index<count> &elements, list_extraction *list = nullptr)
    {
        reader_.expect(elements, list);
    }

    // Logs the URL behind a heading (null: not at all), performs the exchange and logs the reply.
    void fetch(const char *url_heading, reply_log log);

    // As fetch(), but with a reply that is given instead of an exchange.
    void pretend(const char *url_heading, const char *reply, uint64_t length);

    bool has_reply() const { return reply_ != nullptr; }
    const char *reply() const { return reply_.get(); }
    uint64_t reply_length() const { return reply_length_; }

    // Whether the result is "Success". If not, status and error message say why, and the error hook
    // has been called for a refusal.
    bool accepted(error_reading reading = error_reading::standard,
                  exchange_verdict verdict = exchange_verdict::with_message);

    // The text of an element, or null.
    heap_text text_of(const char *element);

    // The same for what the service must hand out: without it, the reply is of no use.
    heap_text required_text_of(const char *element);

    // A "Success" that lacks what was asked for.
    void reply_is_unusable() { status_ = QM_UNUSABLE_RESPONSE; }

    // Counts what an extractor reports, 1 if it could not parse the reply.
    void extracted(uint32_t parse_failed) { parse_failures_ += parse_failed; }

    // Looks up the elements of a table, in its order, into a record's fields.
    template <class Record, size_t count>
    void fill(Record &record, const element_field<Record> (&table)[count])
    {
        for (const auto &[element, field] : table)
            record.*field = text_of(element).release();
    }

    // A record filled from one table, or null if any lookup of the call failed to parse.
    template <class Record, size_t count>
    owned_record<Record> record_of(const element_field<Record> (&table)[count])
    {
        auto record = new_record<Record>();
        fill(*record, table);
        return malformed() ? nullptr : std::move(record);
    }

    // Whether any lookup so far failed to parse the reply.
    bool malformed() const { return parse_failures_ > 0; }

    // What the operation returns. A malformed reply overrides whatever else was found.
    int32_t status() const { return malformed() ? QM_MALFORMED_REPLY : status_; }

private:
    // Whether the reply has been read in one pass, which the first question tries. If not, lookups
    // and extractors read it one by one: only they tell what is wrong with it, in the log and by
    // what they find before it.
    enum class one_pass { untried, whole, failed };

    void log_url(const char *heading);
    void log_reply(reply_log log) const;
    bool read_in_one_pass();
    void refused(error_reading reading);
    void read_error(const char *number_element, const char *message_element,
                    int32_t without_number);
    void failed_exchange(exchange_verdict verdict);

    owned_buffer url_;
    char **error_message_;
    heap_text reply_;
    uint64_t reply_length_ = 0;
    reply_reader reader_;
    one_pass one_pass_ = one_pass::untried;
    int64_t response_code_ = 0;
    uint32_t parse_failures_ = 0;
    int32_t status_ = -1;
};

// Frees a text that was handed out too early, and takes it back.
inline void discard(char **text)
{
    std::free(*text);
    *text = nullptr;
}

// A flag as the service writes it: nothing but this very text sets it.
inline bool is_yes(const char *text) { return text && std::strcmp(text, "yes") == 0; }

// Whether an optional text says anything.
inline bool given(const char *text) { return text && *text; }

} // namespace quillmere
