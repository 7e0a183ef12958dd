// The string buffer as a sequence of operations, compared with a model after each.
#include <algorithm>
#include <vector>

#include "support/choices.h"
#include "support/library.h"

namespace quillmere_fuzz {
namespace {

struct range {
    uint64_t start;
    uint64_t end;
};

struct model {
    std::string text;
    std::vector<range> ranges;

    // Indices are 32-bit numbers with a sign; the two of a range may stand in either order.
    std::vector<bool> marks() const
    {
        std::vector<bool> marked(text.size());
        for (const range &each : ranges) {
            auto start = static_cast<int32_t>(each.start);
            auto end = static_cast<int32_t>(each.end);
            if (start > end)
                std::swap(start, end);
            if (start < 0)
                continue;
            size_t stop = std::min(marked.size(), static_cast<size_t>(end));
            for (auto at = static_cast<size_t>(start); at < stop; ++at)
                marked[at] = true;
        }
        return marked;
    }

    std::string view(const std::string &marker) const
    {
        std::string shown;
        std::vector<bool> marked = marks();
        for (size_t at = 0; at < text.size(); ++at) {
            if (!marked[at])
                shown += text[at];
            else if (at == 0 || !marked[at - 1])
                shown += marker;
        }
        return shown;
    }
};

std::string encoded(const std::string &text)
{
    std::string out;
    for (char each : text) {
        char digits[4];
        std::snprintf(digits, sizeof digits, "%%%02x", static_cast<unsigned char>(each));
        bool passes = std::string_view("!()*^").find(each) != std::string_view::npos ||
                      (each >= '0' && each <= '9') || (each >= 'a' && each <= 'z') ||
                      (each >= 'A' && each <= 'Z');
        out += passes ? std::string(1, each) : digits;
    }
    return out;
}

class pair_of_buffers {
public:
    explicit pair_of_buffers(uint64_t capacity) : buffer_(string_new(capacity)) {}

    void step(choices &chosen)
    {
        switch (chosen.below(9)) {
        case 0:
            return append(chosen.text());
        case 1:
            return append_bytes(chosen);
        case 2:
            return append_hidden(chosen.text());
        case 3:
            return append_hidden_bytes(chosen);
        case 4:
            return append_encoded(chosen.text());
        case 5:
            return append_encoded_hidden(chosen);
        case 6:
            return add_range(chosen);
        case 7:
            return reduce(chosen.number());
        default:
            return append_number(chosen);
        }
    }

    void check(const std::string &marker)
    {
        expect(string_get_size(buffer_.get()) == model_.text.size(), "the length");
        expect(buffer_->length < buffer_->capacity || !buffer_->bytes, "room for the NUL");
        if (!string_get(buffer_.get())) {
            expect(model_.text.empty(), "no text without storage");
            return;
        }
        expect(std::string(string_get(buffer_.get()), model_.text.size() + 1) == model_.text + '\0',
               "the text and its NUL");
        expect(view(marker) == model_.view(marker), "the redacted view");
        expect_no_marked_byte(marker);
    }

private:
    void append(const std::string &text)
    {
        expect_length(string_append(buffer_.get(), text.c_str()), text);
    }

    void append_bytes(choices &chosen)
    {
        std::string bytes(chosen.bytes(chosen.byte()));
        expect_length(string_append_len(buffer_.get(), bytes.data(), bytes.size()), bytes);
    }

    void append_hidden(const std::string &text)
    {
        hide_next(text.size());
        expect_length(string_append_obfs(buffer_.get(), text.c_str()), text);
    }

    void append_hidden_bytes(choices &chosen)
    {
        std::string bytes(chosen.bytes(chosen.byte()));
        hide_next(bytes.size());
        expect_length(string_append_len_obfs(buffer_.get(), bytes.data(), bytes.size()), bytes);
    }

    void append_encoded(const std::string &text)
    {
        expect_length(string_append_urlencode(buffer_.get(), text.c_str()), encoded(text));
    }

    void append_encoded_hidden(choices &chosen)
    {
        if (chosen.below(16) == 0) { // no text, which leaves a range that hides nothing
            model_.ranges.push_back({model_.text.size(), UINT64_MAX});
            expect(string_append_urlencode_obfs(buffer_.get(), nullptr) == -1, "no text");
            return;
        }
        std::string text = chosen.text();
        hide_next(encoded(text).size());
        expect_length(string_append_urlencode_obfs(buffer_.get(), text.c_str()), encoded(text));
    }

    void add_range(choices &chosen)
    {
        range added = {chosen.number(), chosen.number()};
        model_.ranges.push_back(added);
        string_add_obfs_range(buffer_.get(), added.start, added.end);
    }

    void reduce(uint64_t count)
    {
        model_.text.resize(model_.text.size() - std::min<uint64_t>(count, model_.text.size()));
        expect(string_reduce(buffer_.get(), count) == static_cast<int64_t>(model_.text.size()),
               "the length that is left");
    }

    void append_number(choices &chosen)
    {
        uint64_t number = chosen.number();
        expect_length(string_append_num(buffer_.get(), number), std::to_string(number));
    }

    void hide_next(size_t count)
    {
        model_.ranges.push_back({model_.text.size(), model_.text.size() + count});
    }

    void expect_length(int64_t length, const std::string &appended)
    {
        model_.text += appended;
        expect(length == static_cast<int64_t>(model_.text.size()), "the new length");
    }

    std::string view(const std::string &marker)
    {
        size_t size = model_.ranges.empty() ? model_.text.size() : model_.view(marker).size();
        return std::string(string_get_obfs(buffer_.get(), marker.c_str()), size + 1)
            .substr(0, size);
    }

    // If a marked byte had its say in the view, another byte would change it.
    void expect_no_marked_byte(const std::string &marker)
    {
        std::string before = view(marker);
        std::vector<bool> marked = model_.marks();
        for (size_t at = 0; at < marked.size(); ++at)
            if (marked[at])
                buffer_->bytes[at] = static_cast<char>(buffer_->bytes[at] ^ 0x55);
        expect(view(marker) == before, "no marked byte counts in the redacted view");
        model_.text.assign(buffer_->bytes, model_.text.size());
    }

    owned_buffer buffer_;
    model model_;
};

void try_operations(std::string_view input)
{
    choices chosen(input);
    pair_of_buffers pair(chosen.byte());
    std::string marker = chosen.text();
    // The model's time grows with both the text and the ranges, so the steps are bounded.
    for (int steps = 0; chosen.left() && steps < 64; ++steps) {
        within_budget(linear, input.size(), [&] { pair.step(chosen); });
        pair.check(marker);
    }
}

const known_target operations("string_buffer", try_operations);

} // namespace
} // namespace quillmere_fuzz
