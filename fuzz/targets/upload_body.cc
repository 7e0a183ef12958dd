// An upload to the emulator: lines with the parameters, the Content-Disposition, the Content-Digest
// and the length, of which the last two may be "right"; then the bytes.
#include <algorithm>
#include <memory>

#include <openssl/evp.h>

#include "digest.h"
#include "support/choices.h"
#include "support/emulated_service.h"
#include "uploads.h"

namespace quillmere_fuzz {
namespace {

std::string right_digest(std::string_view bytes)
{
    std::string sum = emulator::sha256(bytes);
    unsigned char text[64];
    EVP_EncodeBlock(text, reinterpret_cast<const unsigned char *>(sum.data()),
                    static_cast<int>(sum.size()));
    return "sha-256=:" + std::string(reinterpret_cast<const char *>(text)) + ":";
}

std::string hash_of(std::string_view bytes)
{
    emulator::sha256_sum sum;
    sum.add(bytes);
    return sum.finish_hex();
}

struct upload {
    emulator::request head;
    std::string_view bytes;
    size_t piece;
};

upload upload_in(choices &chosen, const emulated_service &service)
{
    upload made;
    made.head.method = "POST";
    made.head.target = service.filled_in("/api/upload/upload.php?type=desktop&" + chosen.line());
    made.head.content_disposition = chosen.line();
    std::string digest = chosen.line();
    std::string length = chosen.line();
    made.piece = chosen.byte() + 1u;
    made.bytes = chosen.rest();
    made.head.content_digest = digest == "right" ? right_digest(made.bytes) : digest;
    if (length == "right")
        made.head.content_length = made.bytes.size();
    else if (!length.empty())
        made.head.content_length = std::strtoull(length.c_str(), nullptr, 10);
    return made;
}

emulator::reply send(const upload &made, emulated_service &service)
{
    std::unique_ptr<emulator::body_receiver> receiver =
        emulator::receive_upload(made.head, service.state());
    std::string_view left = made.bytes;
    while (!left.empty() && !receiver->is_refused()) {
        size_t count = std::min(made.piece, left.size());
        receiver->take(left.substr(0, count));
        left.remove_prefix(count);
    }
    return receiver->answer();
}

void check_accepted(const emulator::reply &reply, const upload &made, emulated_service &service)
{
    std::string key = look_up(read_document(reply.body), "/key").value_or("");
    document file = service.done("file/get_info", "quick_key=" + key);
    expect(look_up(file, "hash") == hash_of(made.bytes), "the file has the bytes that were sent");
    expect(look_up(file, "size") == std::to_string(made.bytes.size()), "and all of them");
    expect(service.stored_files() == 1, "the bytes are kept once");
}

void try_upload(std::string_view input)
{
    choices chosen(input);
    emulated_service service;
    upload made = upload_in(chosen, service);
    uint64_t revision = service.revision();
    emulator::reply reply;
    within_budget(served, input.size(), [&] { reply = send(made, service); });

    expect_envelope(reply, "0");
    if (reply.http_status == 200)
        return check_accepted(reply, made, service);
    expect(service.stored_files() == 0, "nothing is left of what was refused");
    expect(service.revision() == revision, "a refusal changes nothing");
}

const known_target body("upload_body", try_upload);

} // namespace
} // namespace quillmere_fuzz
