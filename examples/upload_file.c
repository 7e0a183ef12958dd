/*
 * How do I upload a file, and show how far it is?
 *
 *     upload_file FILE
 *
 * Puts the file into the account's root under the name that it has here, and prints its quick key.
 *
 * Environment: QUILLMERE_SERVICE   the service, such as https://localhost:8443
 *              QUILLMERE_UPLOADS   the whole address that takes uploads, such as
 *                                  http://localhost:8080/api/upload/upload.php?type=desktop
 *              QUILLMERE_CA_FILE   the root certificate that vouches for them (PEM)
 *              QUILLMERE_EMAIL, QUILLMERE_PASSWORD
 */
#include <ctype.h>
#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <openssl/evp.h>
#include <quillmere.h>

/* What a TLS record holds: a reply must be read by whole records, and no more than one is sent at
 * once anyway. */
enum { piece_size = 16384 };

static void complain(const char *step, int32_t status, char *message)
{
    /* What a login hands out with a malformed reply may be the token: nothing to show. */
    int is_fit_to_show = message && status != QM_MALFORMED_REPLY;
    fprintf(stderr, "%s failed: %" PRId32 " %s\n", step, status, is_fit_to_show ? message : "");
    api_free(message);
}

/* Returns the session token, or NULL. */
static char *log_in(void)
{
    /* The application's own id and key; these are what a fresh emulator knows. */
    char *token = NULL;
    int32_t status = get_session_token(getenv("QUILLMERE_EMAIL"), getenv("QUILLMERE_PASSWORD"),
                                       NULL, "42", "quillmere-development-key", &token);
    if (status == QM_OK)
        return token;
    complain("logging in", status, token);
    return NULL;
}

/* Reads the file for its size and its SHA-256, in base64. Should it change before it is sent, the
 * service sees that the two do not fit and refuses it. */
static int measure(FILE *file, uint64_t *size, char base64[45])
{
    unsigned char piece[piece_size], digest[EVP_MAX_MD_SIZE];
    EVP_MD_CTX *sum = EVP_MD_CTX_new();
    int done = sum && EVP_DigestInit_ex(sum, EVP_sha256(), NULL);
    size_t count;
    for (*size = 0; done && (count = fread(piece, 1, sizeof piece, file)) > 0; *size += count)
        done = EVP_DigestUpdate(sum, piece, count);
    done = done && EVP_DigestFinal_ex(sum, digest, NULL) && !ferror(file);
    EVP_MD_CTX_free(sum);
    if (done)
        EVP_EncodeBlock((unsigned char *)base64, digest, 32);
    rewind(file);
    return done;
}

/* Percent-encoded more strictly than string_append_urlencode() does it: header fields (RFC 8187) do
 * not let "(", ")" and "*" stand. */
static void append_encoded(string_buffer *header, const char *name)
{
    for (; *name; ++name) {
        char encoded[4];
        unsigned char byte = (unsigned char)*name;
        snprintf(encoded, sizeof encoded, byte < 128 && isalnum(byte) ? "%c" : "%%%02X", byte);
        string_append(header, encoded);
    }
}

static string_buffer *header_for(const char *url, const char *name, uint64_t size,
                                 const char *digest)
{
    const char *host = strstr(url, "//") + 2;
    const char *target = host + strcspn(host, "/");
    string_buffer *header = string_new(1024);
    string_append(header, "POST ");
    string_append(header, target);
    string_append(header, " HTTP/1.1\r\nHost: ");
    string_append_len(header, host, (uint64_t)(target - host));
    /* Closed by the service, so that the reply ends where the connection does. */
    string_append(header, "\r\nConnection: close\r\nContent-Type: application/octet-stream"
                          "\r\nContent-Disposition: attachment; filename*=UTF-8''");
    append_encoded(header, name);
    string_append(header, "\r\nContent-Digest: sha-256=:");
    string_append(header, digest);
    string_append(header, ":\r\nContent-Length: ");
    string_append_num(header, size);
    string_append(header, "\r\n\r\n");
    return header;
}

static int send_all(send_file *connection, const char *bytes, uint64_t count)
{
    while (count > 0) {
        int32_t sent = send_file_write(connection, bytes, count); /* perhaps a part alone */
        if (sent < 0)
            return 0;
        bytes += sent;
        count -= (uint64_t)sent;
    }
    return 1;
}

static int send_content(send_file *connection, FILE *file, uint64_t size)
{
    char piece[piece_size];
    uint64_t sent = 0, tenths = 0;
    size_t count;
    while (sent < size && (count = fread(piece, 1, sizeof piece, file)) > 0) {
        if (!send_all(connection, piece, count))
            return 0;
        sent += count;
        if (sent * 10 / size > tenths) {
            tenths = sent * 10 / size;
            fprintf(stderr, "%" PRIu64 " %% sent\n", tenths * 10);
        }
    }
    return sent == size;
}

/* Reads to the end and returns the file's quick key, or NULL. */
static char *read_reply(send_file *connection)
{
    char piece[piece_size], *quick_key = NULL;
    string_buffer *reply = string_new(0);
    int32_t count;
    while ((count = send_file_read(connection, piece, sizeof piece)) > 0)
        string_append_len(reply, piece, (uint64_t)count);
    const char *text = string_get(reply), *body = text ? strstr(text, "\r\n\r\n") : NULL;
    int32_t status = parse_upload_response(text, string_get_size(reply), &quick_key);
    if (status != 0) {
        char *message = NULL;
        if (body) /* which tells more than the status does */
            get_error_from_xml(body + 4, strlen(body + 4), &status, &message);
        complain("uploading", status, message);
        api_free(quick_key); /* a refused upload may have one, too */
        quick_key = NULL;
    }
    string_delete(reply, 1);
    return quick_key;
}

static char *upload(FILE *file, const char *name, const char *url, int use_tls)
{
    uint64_t size = 0;
    char digest[45], *quick_key = NULL;
    send_file *connection = NULL;
    if (!measure(file, &size, digest) || send_file_new(&connection, url, use_tls, 30) != 0) {
        fputs("the file cannot be read, or the service not be reached\n", stderr);
        return NULL;
    }
    string_buffer *header = header_for(url, name, size, digest);
    if (!send_all(connection, string_get(header), string_get_size(header)) ||
        !send_content(connection, file, size))
        fputs("not everything was sent\n", stderr); /* a refusal may have come meanwhile */
    quick_key = read_reply(connection);
    string_delete(header, 1);
    send_file_delete(&connection);
    return quick_key;
}

int main(int argc, char **argv)
{
    const char *ca_file = getenv("QUILLMERE_CA_FILE"), *uploads = getenv("QUILLMERE_UPLOADS");
    FILE *log = fopen("/dev/null", "w"), *file = argc == 2 ? fopen(argv[1], "rb") : NULL;
    urls[1] = getenv("QUILLMERE_SERVICE");
    if (!file || !log || !ca_file || !uploads || !urls[1]) {
        fputs("usage: upload_file FILE; its source tells of the environment\n", stderr);
        return 2;
    }
    set_output_file(log); /* it shows session tokens, so keep it from the terminal */
    api_global_init(ca_file);

    /* With TLS the port is always 443. Without it whoever carries the bytes can read them, and the
     * session token: that is for an emulator on this very machine. */
    int use_tls = strncmp(uploads, "https:", 6) == 0;
    urls[use_tls ? 3 : 2] = uploads;
    const char *slash = strrchr(argv[1], '/');
    char *token = log_in();
    char *url = get_upload_url(token, NULL, use_tls); /* none for no token */
    char *quick_key = url ? upload(file, slash ? slash + 1 : argv[1], url, use_tls) : NULL;
    if (quick_key)
        puts(quick_key);
    int done = quick_key != NULL;

    api_free(quick_key);
    api_free(url);
    api_free(token);
    api_global_cleanup();
    fclose(file);
    fclose(log);
    return done ? EXIT_SUCCESS : EXIT_FAILURE;
}
