// How do I upload a new revision of a file without losing what somebody else changed?
//
//     upload_revision FILE QUICK-KEY REVISION
//
// Gives the file that the service knows by the key the content of FILE, provided that it still has
// the revision on which FILE is based. Prints the new revision, for the next time.
//
// Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
//              QUILLMERE_UPLOADS   the whole address that takes uploads, such as
//                                  http://localhost:8080/api/upload/upload.php?type=desktop
//              QUILLMERE_CA_FILE   the root certificate that vouches for them (PEM)
//              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <iterator>
#include <memory>
#include <stdexcept>
#include <string>

#include <openssl/evp.h>
#include <quillmere.h>

namespace {

using owned_text = std::unique_ptr<char, decltype(&api_free)>;

std::string text_of(const char *text) { return text ? text : ""; }

// Takes the message over.
void require(int32_t status, const std::string &step, char *message)
{
    const owned_text owned(message, api_free);
    if (status == QM_OK)
        return;
    // What a login hands out with a malformed reply may be the token: nothing to show.
    const std::string shown = status == QM_MALFORMED_REPLY ? "" : text_of(message);
    throw std::runtime_error(step + " failed: " + std::to_string(status) + " " + shown);
}

owned_text log_in()
{
    // The application's own id and key; these are what a fresh emulator knows.
    char *token = nullptr;
    const int32_t status =
        get_session_token(std::getenv("QUILLMERE_EMAIL"), std::getenv("QUILLMERE_PASSWORD"),
                          nullptr, "42", "quillmere-development-key", &token);
    require(status, "logging in", status == QM_OK ? nullptr : token);
    return {token, api_free};
}

// For files that fit into the memory; see upload_file.c for others.
std::string content_of(const char *path)
{
    std::ifstream file(path, std::ios::binary);
    std::string content((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    if (!file)
        throw std::runtime_error(std::string(path) + " cannot be read");
    return content;
}

std::string sha256_of(const std::string &content)
{
    unsigned char digest[EVP_MAX_MD_SIZE];
    unsigned int length = 0;
    if (!EVP_Digest(content.data(), content.size(), digest, &length, EVP_sha256(), nullptr))
        throw std::runtime_error("no SHA-256");
    std::string hexadecimal;
    for (unsigned int index = 0; index < length; ++index) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02x", digest[index]);
        hexadecimal += digits;
    }
    return hexadecimal;
}

// Neither name nor digest is in the header: the file has its name, and the URL says the hash.
std::string request_for(const std::string &url, const std::string &content)
{
    const std::size_t host = url.find("//") + 2;
    const std::size_t target = url.find('/', host);
    return "POST " + url.substr(target) + " HTTP/1.1\r\nHost: " + url.substr(host, target - host) +
           "\r\nConnection: close\r\nContent-Type: application/octet-stream\r\nContent-Length: " +
           std::to_string(content.size()) + "\r\n\r\n" + content;
}

struct upload_connection {
    upload_connection(const std::string &url, bool use_tls)
    {
        if (send_file_new(&connected, url.c_str(), use_tls, 30) != 0)
            throw std::runtime_error("the upload address cannot be reached");
    }
    ~upload_connection() { send_file_delete(&connected); }
    upload_connection(const upload_connection &) = delete;
    upload_connection &operator=(const upload_connection &) = delete;

    // A service that refuses what comes may stop listening, so what it said counts, not this.
    void send(const std::string &request) const
    {
        for (std::size_t at = 0; at < request.size();) {
            // One call moves a part, of what fits into a TLS record.
            const int32_t sent = send_file_write(connected, request.data() + at,
                                                 std::min<std::size_t>(request.size() - at, 16384));
            if (sent < 0)
                return;
            at += static_cast<std::size_t>(sent);
        }
    }

    std::string reply() const
    {
        std::string text;
        char piece[16384]; // a whole TLS record, or the rest of one would wait unseen
        for (int32_t count; (count = send_file_read(connected, piece, sizeof piece)) > 0;)
            text.append(piece, static_cast<std::size_t>(count));
        return text;
    }

    send_file *connected = nullptr;
};

void judge(const std::string &reply)
{
    char *quick_key = nullptr;
    int32_t status = parse_upload_response(reply.data(), reply.size(), &quick_key);
    api_free(quick_key);
    const std::size_t end = reply.find("\r\n\r\n");
    char *message = nullptr;
    if (status != 0 && end != reply.npos) // which tells more: that another revision is there now
        get_error_from_xml(reply.data() + end + 4, reply.size() - end - 4, &status, &message);
    require(status, "uploading", message);
}

// The revision that our content has got. It may have been replaced since by somebody else's, and
// the revision of that is not the one on which ours is based.
std::string revision_of(const char *token, const char *quick_key, const std::string &hash)
{
    file_info *info = nullptr;
    char *message = nullptr;
    const int32_t status = get_file_info(quick_key, token, &message, &info);
    const bool is_ours = text_of(file_info_get_hash(info)) == hash;
    const std::string revision = text_of(file_info_get_revision(info));
    file_info_delete(&info);
    require(status, "reading the file's record", message);
    if (!is_ours)
        throw std::runtime_error("uploaded, and changed again by somebody else");
    return revision;
}

struct running_library {
    explicit running_library(const char *ca_file) { api_global_init(ca_file); }
    ~running_library() { api_global_cleanup(); }
};

} // namespace

int main(int argc, char **argv)
try {
    const std::unique_ptr<FILE, decltype(&fclose)> log(fopen("/dev/null", "w"), fclose);
    const char *ca_file = std::getenv("QUILLMERE_CA_FILE");
    const char *uploads = std::getenv("QUILLMERE_UPLOADS");
    urls[1] = std::getenv("QUILLMERE_SERVICE");
    if (argc != 4 || !log || !ca_file || !uploads || !urls[1])
        throw std::runtime_error(
            "usage: upload_revision FILE QUICK-KEY REVISION; its source tells of the environment");
    set_output_file(log.get()); // it shows session tokens, so keep it from the terminal
    const running_library library(ca_file);

    // With TLS the port is always 443. Without it whoever carries the bytes can read them, and the
    // session token: that is for an emulator on this very machine.
    const bool use_tls = std::string(uploads).rfind("https:", 0) == 0;
    urls[use_tls ? 3 : 2] = uploads;
    const std::string content = content_of(argv[1]);
    const std::string hash = sha256_of(content);
    const owned_text token = log_in();
    const owned_text url(get_patch_upload_url(token.get(), argv[2], std::stoull(argv[3]),
                                              hash.c_str(), content.size(), use_tls),
                         api_free);
    const upload_connection connection(url.get(), use_tls);
    connection.send(request_for(url.get(), content));
    judge(connection.reply());
    std::cout << revision_of(token.get(), argv[2], hash) << '\n';
} catch (const std::exception &failure) {
    std::cerr << failure.what() << '\n';
    return EXIT_FAILURE;
}
