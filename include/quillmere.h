/**
 * @file quillmere.h
 * quillmere: the web API of a cloud file-storage service, for desktop synchronisation clients.
 *
 * An application configures the library through the globals below, calls api_global_init() once,
 * then calls one blocking function per operation from as many threads as it likes, and
 * api_global_cleanup() at the end.
 *
 * Conventions that hold throughout, unless a function says otherwise:
 *
 *   - Text is NUL-terminated UTF-8. Text that is handed out is plain malloc memory of the caller's,
 *     released with free() or api_free(). What a getter returns is borrowed from its record.
 *   - An out-parameter must not be NULL. Operations reset theirs before anything else happens.
 *   - Operations return a status: QM_OK, the service's own error number (positive), or a negative
 *     qm_status.
 *   - Threads: a function that says "any thread" may run on several threads at once, each with
 *     arguments of its own. One that says "configuration" is for one thread while no request is
 *     running. A function that works on a string buffer or record belongs to whichever thread holds
 *     that object, one at a time.
 *   - Memory: when the heap is exhausted the library writes one line to standard error and aborts,
 *     except where a function names another outcome.
 */
#ifndef QUILLMERE_H
#define QUILLMERE_H

#include <stddef.h>
#include <stdint.h>
#include <stdio.h>

/** The version of this header; the library's SONAME carries the major number. */
#define QUILLMERE_VERSION_MAJOR 0
#define QUILLMERE_VERSION_MINOR 1
#define QUILLMERE_VERSION_PATCH 0

#if defined(__GNUC__)
#define QM_API __attribute__((visibility("default")))
#define QM_PRINTF_LIKE(format_index, first_argument)                                               \
    __attribute__((format(printf, format_index, first_argument)))
#else
#define QM_API
#define QM_PRINTF_LIKE(format_index, first_argument)
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* -------------------------------------------------------------------------------------------------
 * Results
 * ---------------------------------------------------------------------------------------------- */

/** What an operation returns besides the service's own error numbers, which are positive. */
typedef enum qm_status {
    QM_OK = 0,                 /**< The service answered "Success". */
    QM_NO_ERROR_ELEMENT = -1,  /**< Refused without an "error" element (direct reading alone). */
    QM_NO_RESPONSE = -2,       /**< No HTTP response code arrived. */
    QM_UNUSABLE_RESPONSE = -3, /**< An HTTP response arrived, but no usable reply in it. */
    QM_SIGNATURE_FAILED = -4,  /**< The request signature could not be made; nothing was sent. */
    QM_UNUSABLE_ERROR_NUMBER = -8, /**< Refused; the error number is missing, 0 or no number. */
    QM_MALFORMED_REPLY = -9        /**< The reply is not well-formed XML. */
} qm_status;

/* -------------------------------------------------------------------------------------------------
 * Configuration: exported variables, read afresh on every request and never locked. An application
 * may read and write them directly, on one thread, while no request is running.
 * ---------------------------------------------------------------------------------------------- */

/** Certificates, time-out and attempts of every transfer. */
typedef struct transfer_settings {
    char *path; /**< Certificate authority bundle (PEM file), malloc memory of the library's, or
                     NULL: then transfers run without verifying the peer's certificate. */
    int64_t default_timeout;     /**< Seconds for a transfer that names none; initially 30. */
    int32_t connection_attempts; /**< How often a request is tried; initially 6. */
} transfer_settings;

/** The proxy of every transfer. The texts are malloc memory of the library's. */
typedef struct proxy_settings {
    int32_t enabled; /**< Non-zero: transfers go through the proxy. */
    char *host;      /**< Host name or address of the proxy. */
    char *user;      /**< User name, or NULL. */
    char *password;  /**< Password, or NULL. */
    int64_t port;    /**< Port of the proxy. */
} proxy_settings;

/**
 * Told of every reply whose result is not "Success".
 *
 * @param url      the request's whole URL, not redacted
 * @param response the reply as it arrived
 * @param status   the service's error number, or a negative qm_status
 * @param message  the reply's message, or NULL
 * @return ignored
 *
 * The texts are borrowed for the time of the call. It runs on the thread of the operation.
 */
typedef int32_t (*api_error_hook)(const char *url, const char *response, int32_t status,
                                  const char *message);

/**
 * Told of a critical failure in the TLS library.
 *
 * @param event_code 0, the critical TLS failure, which is the only event there is
 * @param argument   what was given to install_event_handler()
 *
 * It runs on the thread of the transfer that failed.
 */
typedef void (*event_handler_function)(int32_t event_code, void *argument);

/** The version of the service's interface that operations ask for; initially "2". */
extern QM_API const char *api_version;

/**
 * Base addresses of the service, without a trailing slash: urls[0] plain HTTP, urls[1] HTTPS, on
 * which every operation but update_file is built; and the complete upload addresses, urls[2] plain
 * and urls[3] HTTPS. The texts are borrowed: the library never frees an entry.
 */
extern QM_API const char *urls[4];

/** Called with every refusal by the service; initially check_api_error_empty. NULL calls nothing.
 */
extern QM_API api_error_hook check_api_error;

/** The proxy; initially all zero. See set_user_proxy(). */
extern QM_API proxy_settings proxy_server;

/** Non-zero: operations verify neither the certificate nor the host name; initially 0. */
extern QM_API int32_t ssl_disabled;

/** For test harnesses that keep a pointer here. The library never reads it. */
extern QM_API void *debug_replace_get_response_from_url;

/** Certificate bundle, default time-out and number of attempts; initially NULL, 30 seconds and 6.
 */
extern QM_API transfer_settings ca_cert_pem_path;

/** Where the diagnostic log goes; NULL, the initial value, is standard output. Borrowed. */
extern QM_API FILE *output_file;

/* -------------------------------------------------------------------------------------------------
 * Start, stop and settings
 * ---------------------------------------------------------------------------------------------- */

/**
 * Starts the library: libcurl, the locks of the TLS library, the shared DNS cache.
 *
 * @param ca_path certificate authority bundle (PEM file), copied; NULL leaves ca_cert_pem_path as
 *                it is. The file is read by the transfers, not here. It replaces, and frees, a path
 *                stored earlier.
 *
 * Call it once, before any request and before other threads use libcurl or OpenSSL; again only
 * after api_global_cleanup(). Problems are logged and the library goes on without the part that
 * failed.
 */
QM_API void api_global_init(const char *ca_path);

/**
 * Stops the library: libcurl, the certificate path, the proxy settings and the event handler.
 * Time-out, attempts, ssl_disabled, the log stream and the error hook stay; so do the TLS library's
 * locks and the shared DNS cache, so that OpenSSL stays usable until the process ends.
 *
 * Configuration; call it after the last request has returned.
 */
QM_API void api_global_cleanup(void);

/** Does nothing. May be called on each new thread, from any thread. */
QM_API void api_thread_init(void);

/**
 * Installs the function that is told of a critical TLS failure, instead of any earlier one.
 *
 * @param function the handler, or NULL for none
 * @param argument passed to the handler as it is
 *
 * Valid between api_global_init() and api_global_cleanup(); at other times it does nothing.
 * Configuration.
 */
QM_API void install_event_handler(event_handler_function function, void *argument);

/**
 * Sets the time-out of transfers that name none.
 *
 * @param seconds at least 1, for the whole of one attempt
 * @return 0, or 1 for a value below 1: that is logged, and the setting stays. Configuration.
 */
QM_API int32_t set_default_timeout(int64_t seconds);

/**
 * Sets how often a request is tried before it is given up. There is no pause between attempts.
 *
 * @param attempts at least 1
 * @return 0, or 1 for a value below 1: that is logged, and the setting stays. Configuration.
 */
QM_API int32_t set_connection_attempts(int32_t attempts);

/**
 * Describes a proxy, with copies of the texts, instead of any earlier one. Deliberately, the proxy
 * is not yet used: transfers go through it once the application sets proxy_server.enabled to a
 * non-zero value.
 *
 * @param host     host name or address, or NULL for "127.0.0.1"
 * @param port     port, or 0 for 80; a negative value is stored as it is
 * @param user     user name, or NULL
 * @param password password, or NULL
 *
 * The earlier texts are freed first, so the arguments must not be among them. A copy that the heap
 * has no room for leaves its field NULL. Configuration.
 */
QM_API void set_user_proxy(const char *host, int64_t port, const char *user, const char *password);

/** Stops using the proxy and keeps its description: setting proxy_server.enabled restores it.
 * Configuration. */
QM_API void disable_user_proxy(void);

/** Frees the proxy's texts and sets the whole of proxy_server to zero. Configuration. */
QM_API void cleanup_proxy(void);

/** Directs the diagnostic log to a stream that the caller keeps open, or to standard output for
 * NULL. Configuration. */
QM_API void set_quillmere_output_file(FILE *stream);

/** The same as set_quillmere_output_file(). */
QM_API void set_output_file(FILE *stream);

/** Does nothing on this platform; there for source compatibility. Any thread. */
QM_API void set_windows_output_file(FILE *stream);

/** Does nothing; there for source compatibility. Any thread. */
QM_API void print_curl_version_info(void);

/**
 * Writes one message to the diagnostic log and flushes the stream. Nothing is added to it: no
 * prefix, no time, no line end.
 *
 * @param format printf format, followed by its arguments
 * @return what fflush() returned: 0, or EOF when the stream could not be written
 *
 * Any thread; messages of several threads may interleave, each staying whole.
 */
QM_API int32_t qm_printf(const char *format, ...) QM_PRINTF_LIKE(1, 2);

/** Releases text that the library handed out, as free() does. NULL is ignored. Any thread. */
QM_API void api_free(void *memory);

/** The initial check_api_error hook: ignores its arguments and returns 0. Any thread. */
QM_API int32_t check_api_error_empty(const char *url, const char *response, int32_t status,
                                     const char *message);

/* -------------------------------------------------------------------------------------------------
 * Locks for the TLS library and the shared DNS cache. api_global_init() uses these; an application
 * has no need to.
 * ---------------------------------------------------------------------------------------------- */

/**
 * Logs the version of the TLS library and gives an OpenSSL of the callback-locking generation its
 * locks; OpenSSL from 1.1.0 on locks for itself.
 *
 * @return 0, also when libcurl uses another TLS library; -1 when the locks could not be allocated
 *
 * Configuration. Every call installs locks of its own and leaves earlier ones allocated.
 */
QM_API int32_t tls_init(void);

/**
 * Makes a libcurl share handle (CURLSH *) through which transfers share one DNS cache.
 *
 * @return the handle, the caller's to release with curl_share_cleanup(); NULL when it could not be
 *         made, which is logged except when libcurl made no handle at all. Any thread.
 */
QM_API void *create_curl_share_init(void);

/**
 * libcurl's lock and unlock callbacks for a share handle. Each kind of shared data has one
 * process-wide mutex; kinds that the library does not share have one in common, and are logged.
 *
 * @param handle the transfer (CURL *), ignored
 * @param kind   a curl_lock_data value
 * @param access a curl_lock_access value, ignored: every lock is exclusive
 * @param user   ignored
 * @return what pthread_mutex_lock() or pthread_mutex_unlock() returned, 0 for success. Any thread.
 */
QM_API int32_t curl_sh_lock_function(void *handle, int32_t kind, int32_t access, void *user);
QM_API int32_t curl_sh_unlock_function(void *handle, int32_t kind, int32_t access, void *user);

/* -------------------------------------------------------------------------------------------------
 * String buffer: growable text, with ranges that are hidden when it is logged. The text itself is
 * always whole.
 * ---------------------------------------------------------------------------------------------- */

/** A stretch of a string buffer that holds a secret. */
typedef struct redaction_range {
    uint64_t start;               /**< Index of the first byte. */
    uint64_t end;                 /**< Index behind the last byte. */
    struct redaction_range *next; /**< The range added after this one, or NULL. */
} redaction_range;

/** Growable text. It owns everything that its fields point to. */
typedef struct string_buffer {
    uint64_t length;   /**< Bytes of text, its terminating NUL not counted. */
    uint64_t capacity; /**< Bytes allocated for the text. */
    char *bytes;       /**< The text and its NUL, or NULL as long as nothing was allocated. */
    redaction_range *redaction_ranges; /**< In the order in which they were added, or NULL. */
    char *redacted_copy;               /**< What string_get_obfs() made last, or NULL. */
} string_buffer;

/**
 * Makes an empty buffer.
 *
 * @param capacity bytes to allocate for the text; 0 allocates none until the first append
 * @return the buffer, released with string_delete()
 */
QM_API string_buffer *string_new(uint64_t capacity);

/**
 * Appends to a buffer; the _obfs forms also mark what they appended as a secret.
 *
 * string_append appends text as it is; string_append_len appends count bytes of any kind and checks
 * nothing for NULL; string_append_urlencode appends text percent-encoded: letters, digits and the
 * characters ! ( ) * ^ stand for themselves, every other byte becomes "%" and two lower-case
 * hexadecimal digits.
 *
 * @param buffer the buffer; for string_append_urlencode_obfs it must not be NULL
 * @param text   what to append; must not be a part of the buffer's own text
 * @param bytes  the same for string_append_len
 * @param count  number of those bytes
 * @return the new length, or -1 if buffer or text is NULL
 *
 * string_append_urlencode_obfs adds a range even when its text is NULL; that range hides nothing.
 */
QM_API int64_t string_append(string_buffer *buffer, const char *text);
QM_API int64_t string_append_len(string_buffer *buffer, const char *bytes, uint64_t count);
QM_API int64_t string_append_urlencode(string_buffer *buffer, const char *text);
QM_API int64_t string_append_obfs(string_buffer *buffer, const char *text);
QM_API int64_t string_append_len_obfs(string_buffer *buffer, const char *bytes, uint64_t count);
QM_API int64_t string_append_urlencode_obfs(string_buffer *buffer, const char *text);

/**
 * Marks the bytes from start up to, and without, end as a secret. Nothing is checked: the redacted
 * view swaps the two when they are reversed, and leaves out what lies beyond the text. Indices are
 * read as signed 32-bit numbers there, so a secret must lie within the first 2 GiB.
 */
QM_API void string_add_obfs_range(string_buffer *buffer, uint64_t start, uint64_t end);

/** The text, borrowed until the next append or the buffer's end; NULL if nothing was ever
 * allocated. */
QM_API const char *string_get(const string_buffer *buffer);

/** The length of the text in bytes. */
QM_API uint64_t string_get_size(const string_buffer *buffer);

/**
 * The text as it may be logged: each unbroken stretch of marked bytes is replaced by a marker.
 *
 * @param buffer      the buffer
 * @param replacement the marker, or NULL for "(omitted)"
 * @return the buffer's own text if it has no ranges; otherwise a copy, borrowed until the next call
 *         on this buffer or its end
 */
QM_API const char *string_get_obfs(string_buffer *buffer, const char *replacement);

/**
 * Cuts bytes off the end of the text.
 *
 * @param buffer the buffer
 * @param count  bytes to cut; more than there are empties the text
 * @return the new length
 */
QM_API int64_t string_reduce(string_buffer *buffer, uint64_t count);

/**
 * Releases a buffer. NULL is ignored.
 *
 * @param buffer    the buffer, or NULL
 * @param free_text 1 frees the text too; any other value leaves it to the caller, who took it with
 *                  string_get() and frees it with free()
 */
QM_API void string_delete(string_buffer *buffer, int32_t free_text);

/** A copy of NUL-terminated text, the caller's; NULL for NULL. Any thread. */
QM_API char *string_dup(const char *text);

/* -------------------------------------------------------------------------------------------------
 * Encoding
 * ---------------------------------------------------------------------------------------------- */

/**
 * Whether a character stands for itself in a percent-encoded value.
 *
 * @param character only its low 8 bits count
 * @return 1 for an ASCII letter or digit and for ! ( ) * ^, else 0. Deliberately, "-", ".", "_" and
 *         "~" are encoded, though RFC 3986 does not ask for it. Any thread.
 */
QM_API int32_t url_acceptable_letter(int32_t character);

/**
 * Appends a number, which is unsigned: -1 becomes 18446744073709551615.
 *
 * @param buffer the buffer
 * @param number the number
 * @param base   2 to 16, not checked; digits above 9 are lower-case letters
 * @return the new length, or -1 if buffer is NULL
 *
 * At most 63 digits are written, so that in base 2 a number of 2^63 and more loses its first digit.
 */
QM_API int64_t string_append_num(string_buffer *buffer, uint64_t number);
QM_API int64_t string_append_num_base(string_buffer *buffer, uint64_t number, int32_t base);

/**
 * Renders a number as string_append_num_base() does, into storage of the caller's.
 *
 * @param number  the number
 * @param base    as there
 * @param scratch at least 65 bytes; the digits end at index 63 and the NUL stands at index 64
 * @return the first digit, within scratch. Any thread.
 */
QM_API char *itoa_s(uint64_t number, int32_t base, char *scratch);

/**
 * Writes the SHA-1 digest (FIPS 180-4) of some bytes as 40 lower-case hexadecimal digits and a NUL.
 *
 * @param data            the bytes; may be NULL if length is 0
 * @param length          number of bytes
 * @param output          storage of the caller's
 * @param output_capacity its size in bytes, at least 41
 * @return 0, or 1 for a capacity below 41, in which case nothing is written. Any thread.
 */
QM_API int32_t simple_sha1(const void *data, uint64_t length, char *output,
                           uint64_t output_capacity);

/* -------------------------------------------------------------------------------------------------
 * HTTP exchange
 * ---------------------------------------------------------------------------------------------- */

/**
 * Fetches a URL, trying again at once when a transfer fails, up to
 * ca_cert_pem_path.connection_attempts times.
 *
 * @param url             the whole URL, at least 27 bytes long
 * @param body            bytes to POST, or NULL
 * @param body_length     their number, or 0; the request is a GET unless both body and body_length
 *                        are given
 * @param response        receives the body of the response with a NUL behind it, or NULL if it was
 *                        empty or no transfer succeeded; the caller frees it
 * @param response_length receives its length in bytes
 * @param timeout_seconds for each attempt; below 1 means ca_cert_pem_path.default_timeout
 * @return the HTTP status code (RFC 9110) whatever it says, 0 for a scheme that has none, or -1 if
 *         the URL is too short or every attempt failed. Each failed transfer is logged.
 *
 * Up to 30 redirects are followed, to HTTP and HTTPS alone, and never from HTTPS back to HTTP.
 * Blocks. Any thread, between api_global_init() and api_global_cleanup().
 */
QM_API int64_t get_response_from_url(const char *url, const void *body, uint64_t body_length,
                                     char **response, uint64_t *response_length,
                                     int64_t timeout_seconds);

/**
 * libcurl's write callback: appends size * count bytes to a string buffer.
 *
 * @param data   the bytes
 * @param size   size of an item
 * @param count  number of items
 * @param buffer the string_buffer
 * @return size * count: a transfer is never stopped from here
 */
QM_API size_t curl_write_function(char *data, size_t size, size_t count, void *buffer);

/**
 * Probes a URL once, with a HEAD request. ssl_disabled plays no part.
 *
 * @param url                  the whole URL
 * @param timeout_milliseconds rounded away from zero to whole seconds; 0 for none
 * @return 1 if the status code is 200 to 399, else 0, which is logged. Blocks. Any thread.
 */
QM_API int32_t check_url_response_code(const char *url, int32_t timeout_milliseconds);

/**
 * Probes a URL once, with a GET request, and compares what it answers. ssl_disabled plays no part.
 *
 * @param base_url             the URL up to the "?"
 * @param query                the query, which is percent-encoded as a whole
 * @param expected_body        the body that must arrive
 * @param timeout_milliseconds rounded away from zero to whole seconds; 0 for none
 * @return 1 if the status code is 200 and the body equals the expected one, else 0, which is
 *         logged. Blocks. Any thread.
 */
QM_API int32_t check_url_response(const char *base_url, const char *query,
                                  const char *expected_body, int32_t timeout_milliseconds);

/**
 * Gives a link without a scheme the one named.
 *
 * @param url    the link, or NULL
 * @param scheme the bare name, such as "https", or NULL
 * @return the scheme, ":" and the link, if the link's first "//" has no ":" before it and a byte
 *         behind it; otherwise a copy of the link; NULL for NULL. The caller frees it. Any thread.
 */
QM_API char *normalize_url(const char *url, const char *scheme);

/* -------------------------------------------------------------------------------------------------
 * Streaming upload
 *
 * A raw connection to the upload server. The application writes its own HTTP request over it, to a
 * URL from get_upload_url() or get_patch_upload_url(), and reads the raw reply, which
 * parse_upload_response() interprets.
 *
 *   - One call moves at most one chunk: call again until everything is sent.
 *   - A connection may idle for 60 seconds; after that reads and writes fail until it is deleted.
 *   - With TLS the port is always 443, whatever the URL says, and use_tls must agree with the URL's
 *     scheme.
 *   - With TLS a read buffer should hold a whole TLS record, 16 KiB (RFC 8446): readiness is asked
 *     of the socket, which knows nothing of bytes that the TLS library has taken in already.
 *   - The proxy and ssl_disabled are not applied, deliberately.
 *   - Messages go to standard output, not to the diagnostic log.
 * ---------------------------------------------------------------------------------------------- */

/** A connection. Owned by the application, released with send_file_delete(). */
typedef struct send_file {
    void *handle;    /**< The libcurl easy handle (CURL *), connected. */
    int64_t timeout; /**< Seconds, exactly as given to send_file_new(); for the application. */
    int32_t socket;  /**< The socket's descriptor. */
    int64_t last_transmission; /**< Seconds since the epoch when the last byte moved. */
} send_file;

/**
 * Connects to the host of a URL.
 *
 * @param connection receives the connection, or NULL
 * @param url        where to connect to
 * @param use_tls    non-zero for TLS on port 443, verified against ca_cert_pem_path.path; without a
 *                   path the peer's certificate is not verified
 * @param timeout    seconds for connecting; below 1 means 60
 * @return 0; -1 if connecting failed; -2 if the socket is unknown; -200 if libcurl made no handle.
 *         Blocks. Any thread.
 */
QM_API int32_t send_file_new(send_file **connection, const char *url, int32_t use_tls,
                             int64_t timeout);

/**
 * Sends some of the bytes given, waiting for room.
 *
 * @param connection the connection
 * @param data       the bytes
 * @param size       their number; of 0 bytes none are sent and the time of the last transmission
 *                   stays
 * @return the number sent, which may be smaller; -5 if nothing could be sent for 60 seconds; -6 if
 *         sending failed
 */
QM_API int32_t send_file_write(send_file *connection, const void *data, uint64_t size);

/**
 * Receives some bytes, waiting for them.
 *
 * @param connection the connection
 * @param buffer     receives the bytes
 * @param size       room in the buffer
 * @return the number received; 0 if the peer has closed the connection; -5 if nothing came for 60
 *         seconds; -7 if receiving failed
 */
QM_API int32_t send_file_read(send_file *connection, void *buffer, uint64_t size);

/** Closes and frees *connection, and sets the pointer to NULL. NULL, or a pointer to NULL, does
 * nothing. */
QM_API void send_file_delete(send_file **connection);

/** Seconds since a byte last moved, or 0 if the clock cannot be read. */
QM_API uint64_t send_file_seconds_since_last_transmission(const send_file *connection);

/**
 * Makes this moment the time of the last transmission.
 *
 * @return seconds since the epoch, or -1 if the clock cannot be read, in which case nothing is
 *         changed
 */
QM_API int64_t send_file_update_connection_last_timestamp(send_file *connection);

/* -------------------------------------------------------------------------------------------------
 * Reading replies
 * ---------------------------------------------------------------------------------------------- */

/** What a lookup hands to its parser callbacks. */
typedef struct node_value_state {
    const char *sought;  /**< Element name, or path from below the root, borrowed. */
    char *value;         /**< Text collected so far, malloc memory, or NULL. */
    int32_t collecting;  /**< 1 while text is collected. */
    int32_t depth;       /**< Open elements; the root is at depth 1. */
    string_buffer *path; /**< "/" and name of each open element below the root. */
} node_value_state;

/**
 * Reads the text of an element of an XML document.
 *
 * @param xml          the document, UTF-8
 * @param length       its length in bytes; only the low 32 bits count
 * @param sought       an element's name, which matches at any depth, or a path such as
 *                     "/folder_info/name", which leaves out the root
 * @param parse_failed receives 1 if the document is not well-formed, which is logged, else 0
 * @return the text, the caller's to free; NULL if nothing matched, the matches hold no text, or xml
 *         is NULL or length 0
 *
 * The text of several matches is joined. Deliberately, an element's text ends at the next end tag
 * of any element, so what follows a child element is left out. After a parse failure the text
 * collected before it is returned. Any thread.
 */
QM_API char *simple_get_xml_node_value(const char *xml, uint64_t length, const char *sought,
                                       int32_t *parse_failed);

/**
 * The lookup's expat callbacks: start tag, end tag and text. state is a node_value_state; the
 * attributes are ignored.
 */
QM_API void simple_get_xml_node_value_start(void *state, const char *element,
                                            const char **attributes);
QM_API void simple_get_xml_node_value_end(void *state, const char *element);
QM_API void simple_get_xml_node_value_data(void *state, const char *text, int32_t length);

/**
 * Appends text to a malloc'ed, NUL-terminated value, allocating it if it is NULL.
 *
 * @param value  the value, which may move
 * @param text   the text, which needs no NUL
 * @param length its length in bytes
 */
QM_API void node_value_data_accumulate(char **value, const char *text, int32_t length);

/**
 * Reads the error number and message of a refusal: the elements "error" and "message" directly
 * below the root.
 *
 * @param xml           the reply
 * @param length        its length in bytes
 * @param error_code    receives the service's number, QM_UNUSABLE_ERROR_NUMBER, or
 *                      QM_MALFORMED_REPLY; may be NULL
 * @param error_message receives the message or NULL, and after a parse failure a text that says so;
 *                      the caller frees it; may be NULL
 *
 * Any thread.
 */
QM_API void get_error_from_xml(const char *xml, uint64_t length, int32_t *error_code,
                               char **error_message);

/* -------------------------------------------------------------------------------------------------
 * Request objects: one call of the service's interface, put together by hand.
 * ---------------------------------------------------------------------------------------------- */

/** A request. Its four pointers are owned by it. Callers write url, post_data, timeout and verbose.
 */
typedef struct api_request {
    string_buffer *url;       /**< The whole URL, from api_url_new_https() or api_url_new_http(). */
    string_buffer *post_data; /**< Body to POST, or NULL for a GET. */
    char *response;           /**< Body of the response after the call, or NULL. */
    uint64_t response_length; /**< Its length in bytes. */
    int64_t timeout;          /**< Seconds; below 1, as at first, means the default time-out. */
    int32_t verbose; /**< Non-zero, as at first: the call logs the redacted URL and the response. */
} api_request;

/**
 * Starts a request's URL: the base address of urls[1] or urls[0], the path and "?".
 *
 * @return a string buffer, the caller's until a request takes it
 */
QM_API string_buffer *api_url_new_https(const char *path);
QM_API string_buffer *api_url_new_http(const char *path);

/**
 * Adds a parameter to a URL: "&", the key as it is, "=", and the value, percent-encoded if it is
 * text. Deliberately, "&" comes before the first parameter too. The value of a sensitive one is
 * left out when the URL is logged.
 *
 *   required                adds always; a NULL value leaves the key with nothing behind the "="
 *   optional, null          skips NULL
 *   optional, null_or_empty skips NULL and ""
 *   optional, num, negative skips numbers below 0
 *   optional, num, zero     skips 0 and numbers below
 *
 * Numbers are written unsigned, so that a required -1 becomes 18446744073709551615. The three
 * functions with a trailing underscore do the same as the required ones.
 *
 * @return the URL's length, or -1 if a required value is NULL
 */
QM_API int64_t url_add_required_parameter(string_buffer *url, const char *key, const char *value);
QM_API int64_t url_add_required_sensitive_parameter(string_buffer *url, const char *key,
                                                    const char *value);
QM_API int64_t url_add_required_num_parameter(string_buffer *url, const char *key, int64_t value);
QM_API int64_t url_add_optional_parameter_null(string_buffer *url, const char *key,
                                               const char *value);
QM_API int64_t url_add_optional_parameter_null_or_empty(string_buffer *url, const char *key,
                                                        const char *value);
QM_API int64_t url_add_optional_sensitive_parameter_null(string_buffer *url, const char *key,
                                                         const char *value);
QM_API int64_t url_add_optional_sensitive_parameter_null_or_empty(string_buffer *url,
                                                                  const char *key,
                                                                  const char *value);
QM_API int64_t url_add_optional_num_parameter_negative(string_buffer *url, const char *key,
                                                       int64_t value);
QM_API int64_t url_add_optional_num_parameter_zero(string_buffer *url, const char *key,
                                                   int64_t value);
QM_API int64_t url_add_string_parameter_(string_buffer *url, const char *key, const char *value);
QM_API int64_t url_add_sensitive_string_parameter_(string_buffer *url, const char *key,
                                                   const char *value);
QM_API int64_t url_add_num_parameter_(string_buffer *url, const char *key, int64_t value);

/** Makes an empty request, released with api_request_delete(). */
QM_API api_request *api_request_new(void);

/**
 * Performs a request and judges the reply.
 *
 * @param request the request, which then holds the response
 * @param message receives the message of a failure, the caller's to free; left as it was otherwise,
 *                so set it to NULL beforehand. Must not be NULL
 * @return QM_OK, the service's own error number, QM_NO_RESPONSE, QM_UNUSABLE_RESPONSE,
 *         QM_UNUSABLE_ERROR_NUMBER or QM_MALFORMED_REPLY, which overrides the others. The error
 *         hook is called with refusals alone.
 *
 * Blocks. Any thread, each with a request of its own.
 */
QM_API int32_t make_api_call(api_request *request, char **message);

/** Frees *request and all that it holds, and leaves the pointer as it was. NULL, or a pointer to
 * NULL, does nothing. */
QM_API void api_request_delete(api_request **request);

/* -------------------------------------------------------------------------------------------------
 * Records
 *
 * The results of operations. For each kind of record there is
 *
 *   <record>_new          makes a record with copies of its own of the texts, any of which may be
 *                         NULL;
 *   <record>_get_<field>  returns a field: the text of one element of the reply exactly as it was
 *                         sent, numbers, dates and yes/no answers included, or NULL when the reply
 *                         lacked it. The text belongs to the record. NULL (0 for a number) if the
 *                         record is NULL;
 *   <record>_delete       frees *record and its texts, and deliberately leaves the pointer as it
 *                         was. NULL, or a pointer to NULL, does nothing.
 *
 * A record may be read on several threads at once. What the texts mean in detail, and in which
 * units the figures are, is up to the service.
 * ---------------------------------------------------------------------------------------------- */

/**
 * What the service knows of one file. Opaque, and never changed once handed out.
 *
 *   quickkey            the key by which operations name the file
 *   parent_folderkey    key of the folder that it lies in
 *   filename            its name
 *   created             when it was made
 *   downloads           how often it was downloaded
 *   desc                its description
 *   tags                its tags
 *   size                its length in bytes
 *   privacy             "public" or "private"
 *   type                the kind of file that it is, element "filetype"
 *   mimetype            its media type
 *   hash                digest of its content, in hexadecimal
 *   delete_date         when it was deleted, if it was
 *   password_protected  whether a password protects it
 *   revision            the revision of the account in which it changed last
 *   owner_name          name of its owner
 *   flag                a number by which the service marks it
 *   shared_by_user      whether it is the account that shares it
 *   permissions         what the account may do with it
 */
typedef struct file_info file_info;

QM_API file_info *file_info_new(const char *quickkey, const char *parent_folderkey,
                                const char *filename, const char *created, const char *downloads,
                                const char *desc, const char *tags, const char *size,
                                const char *privacy, const char *type, const char *mimetype,
                                const char *hash, const char *delete_date,
                                const char *password_protected, const char *revision,
                                const char *owner_name, const char *flag,
                                const char *shared_by_user, const char *permissions);
QM_API const char *file_info_get_quickkey(const file_info *record);
QM_API const char *file_info_get_parent_folderkey(const file_info *record);
QM_API const char *file_info_get_filename(const file_info *record);
QM_API const char *file_info_get_created(const file_info *record);
QM_API const char *file_info_get_downloads(const file_info *record);
QM_API const char *file_info_get_desc(const file_info *record);
QM_API const char *file_info_get_tags(const file_info *record);
QM_API const char *file_info_get_size(const file_info *record);
QM_API const char *file_info_get_privacy(const file_info *record);
QM_API const char *file_info_get_type(const file_info *record);
QM_API const char *file_info_get_mimetype(const file_info *record);
QM_API const char *file_info_get_hash(const file_info *record);
QM_API const char *file_info_get_delete_date(const file_info *record);
QM_API const char *file_info_get_password_protected(const file_info *record);
QM_API const char *file_info_get_revision(const file_info *record);
QM_API const char *file_info_get_owner_name(const file_info *record);
QM_API const char *file_info_get_flag(const file_info *record);
QM_API const char *file_info_get_shared_by_user(const file_info *record);
QM_API const char *file_info_get_permissions(const file_info *record);
QM_API void file_info_delete(file_info **record);

/**
 * What the service knows of one folder. Opaque, and never changed once handed out.
 *
 *   folderkey         the key by which operations name the folder
 *   foldername        its name
 *   created           when it was made
 *   desc              its description
 *   tags              its tags
 *   foldercount       number of folders directly in it
 *   filecount         number of files directly in it
 *   total_files       number of files in it at any depth
 *   total_folders     number of folders in it at any depth
 *   total_size        bytes of the files in it at any depth
 *   revision          the revision of the account in which it changed last
 *   epoch             epoch of the account's file tree
 *   shared            whether another account sees it
 *   owner_name        name of its owner
 *   parent_folderkey  key of the folder that it lies in
 *   delete_date       when it was deleted, if it was
 *   custom_url        an address of its own, if it was given one
 *   dbx_enabled       whether it is linked with Dropbox, element "dropbox_enabled"
 *   flag              a number by which the service marks it
 *   shared_by_user    whether it is the account that shares it
 *   permissions       what the account may do with it
 *   avatar            address of its picture
 *   privacy           "public" or "private"
 *   byte_count        bytes of the files directly in it
 */
typedef struct folder_info folder_info;

QM_API folder_info *
folder_info_new(const char *folderkey, const char *foldername, const char *created,
                const char *desc, const char *tags, const char *foldercount, const char *filecount,
                const char *total_files, const char *total_folders, const char *total_size,
                const char *revision, const char *epoch, const char *shared, const char *owner_name,
                const char *parent_folderkey, const char *delete_date, const char *custom_url,
                const char *dbx_enabled, const char *flag, const char *shared_by_user,
                const char *permissions, const char *avatar, const char *privacy,
                const char *byte_count);
QM_API const char *folder_info_get_folderkey(const folder_info *record);
QM_API const char *folder_info_get_foldername(const folder_info *record);
QM_API const char *folder_info_get_created(const folder_info *record);
QM_API const char *folder_info_get_desc(const folder_info *record);
QM_API const char *folder_info_get_tags(const folder_info *record);
QM_API const char *folder_info_get_foldercount(const folder_info *record);
QM_API const char *folder_info_get_filecount(const folder_info *record);
QM_API const char *folder_info_get_total_files(const folder_info *record);
QM_API const char *folder_info_get_total_folders(const folder_info *record);
QM_API const char *folder_info_get_total_size(const folder_info *record);
QM_API const char *folder_info_get_revision(const folder_info *record);
QM_API const char *folder_info_get_epoch(const folder_info *record);
QM_API const char *folder_info_get_shared(const folder_info *record);
QM_API const char *folder_info_get_owner_name(const folder_info *record);
QM_API const char *folder_info_get_parent_folderkey(const folder_info *record);
QM_API const char *folder_info_get_delete_date(const folder_info *record);
QM_API const char *folder_info_get_custom_url(const folder_info *record);
QM_API const char *folder_info_get_dbx_enabled(const folder_info *record);
QM_API const char *folder_info_get_flag(const folder_info *record);
QM_API const char *folder_info_get_shared_by_user(const folder_info *record);
QM_API const char *folder_info_get_permissions(const folder_info *record);
QM_API const char *folder_info_get_avatar(const folder_info *record);
QM_API const char *folder_info_get_privacy(const folder_info *record);
QM_API const char *folder_info_get_byte_count(const folder_info *record);
QM_API void folder_info_delete(folder_info **record);

/**
 * The account. The fb_ and tw_ texts describe a linked Facebook and Twitter account, and are NULL
 * when none is linked, but for fb_linked and tw_linked. Opaque, and never changed once handed out.
 *
 *   email                   e-mail address
 *   first_name              first name
 *   last_name               last name
 *   display_name            the name that others see
 *   gender                  gender
 *   birthdate               date of birth, element "birth_date"
 *   location                place
 *   website                 address of a web site
 *   premium                 whether the account is a paid one
 *   bandwidth               bandwidth that is left
 *   created                 when the account was made
 *   max_upload              greatest length of an upload, element "max_upload_size"
 *   max_instant_upload      the same for an upload by digest alone, element
 *                           "max_instant_upload_size"
 *   validated               whether the e-mail address was confirmed
 *   tos_accepted            which terms of service were accepted
 *   used_storage            storage in use, element "used_storage_size"
 *   base_storage            storage that comes with the account
 *   bonus_storage           storage that was added to it
 *   storage_limit           both together
 *   storage_limit_exceeded  whether more is in use than that
 *   options                 options of the account
 *   fb_facebook_id          id of the Facebook account
 *   fb_date_created         when it was linked
 *   fb_email                its e-mail address
 *   fb_facebook_url         address of its page
 *   fb_name                 its full name
 *   fb_firstname            its first name
 *   fb_lastname             its last name
 *   fb_hometown             its home town
 *   fb_location             its place
 *   fb_i18n                 its language and country
 *   fb_timezone             its time zone
 *   fb_linked               "yes" if a Facebook account is linked
 *   tw_twitter_id           id of the Twitter account
 *   tw_date_created         when it was linked
 *   tw_screen_name          its handle
 *   tw_name                 its full name
 *   tw_i18n                 its language and country
 *   tw_linked               "yes" if a Twitter account is linked
 */
typedef struct user_info user_info;

QM_API user_info *
user_info_new(const char *email, const char *first_name, const char *last_name,
              const char *display_name, const char *gender, const char *birthdate,
              const char *location, const char *website, const char *premium, const char *bandwidth,
              const char *created, const char *max_upload, const char *max_instant_upload,
              const char *validated, const char *tos_accepted, const char *used_storage,
              const char *base_storage, const char *bonus_storage, const char *storage_limit,
              const char *storage_limit_exceeded, const char *options, const char *fb_facebook_id,
              const char *fb_date_created, const char *fb_email, const char *fb_facebook_url,
              const char *fb_name, const char *fb_firstname, const char *fb_lastname,
              const char *fb_hometown, const char *fb_location, const char *fb_i18n,
              const char *fb_timezone, const char *fb_linked, const char *tw_twitter_id,
              const char *tw_date_created, const char *tw_screen_name, const char *tw_name,
              const char *tw_i18n, const char *tw_linked);
QM_API const char *user_info_get_email(const user_info *record);
QM_API const char *user_info_get_first_name(const user_info *record);
QM_API const char *user_info_get_last_name(const user_info *record);
QM_API const char *user_info_get_display_name(const user_info *record);
QM_API const char *user_info_get_gender(const user_info *record);
QM_API const char *user_info_get_birthdate(const user_info *record);
QM_API const char *user_info_get_location(const user_info *record);
QM_API const char *user_info_get_website(const user_info *record);
QM_API const char *user_info_get_premium(const user_info *record);
QM_API const char *user_info_get_bandwidth(const user_info *record);
QM_API const char *user_info_get_created(const user_info *record);
QM_API const char *user_info_get_max_upload(const user_info *record);
QM_API const char *user_info_get_max_instant_upload(const user_info *record);
QM_API const char *user_info_get_validated(const user_info *record);
QM_API const char *user_info_get_tos_accepted(const user_info *record);
QM_API const char *user_info_get_used_storage(const user_info *record);
QM_API const char *user_info_get_base_storage(const user_info *record);
QM_API const char *user_info_get_bonus_storage(const user_info *record);
QM_API const char *user_info_get_storage_limit(const user_info *record);
QM_API const char *user_info_get_storage_limit_exceeded(const user_info *record);
QM_API const char *user_info_get_options(const user_info *record);
QM_API const char *user_info_get_fb_facebook_id(const user_info *record);
QM_API const char *user_info_get_fb_date_created(const user_info *record);
QM_API const char *user_info_get_fb_email(const user_info *record);
QM_API const char *user_info_get_fb_facebook_url(const user_info *record);
QM_API const char *user_info_get_fb_name(const user_info *record);
QM_API const char *user_info_get_fb_firstname(const user_info *record);
QM_API const char *user_info_get_fb_lastname(const user_info *record);
QM_API const char *user_info_get_fb_hometown(const user_info *record);
QM_API const char *user_info_get_fb_location(const user_info *record);
QM_API const char *user_info_get_fb_i18n(const user_info *record);
QM_API const char *user_info_get_fb_timezone(const user_info *record);
QM_API const char *user_info_get_fb_linked(const user_info *record);
QM_API const char *user_info_get_tw_twitter_id(const user_info *record);
QM_API const char *user_info_get_tw_date_created(const user_info *record);
QM_API const char *user_info_get_tw_screen_name(const user_info *record);
QM_API const char *user_info_get_tw_name(const user_info *record);
QM_API const char *user_info_get_tw_i18n(const user_info *record);
QM_API const char *user_info_get_tw_linked(const user_info *record);
QM_API void user_info_delete(user_info **record);

/**
 * The account's quotas, and how much of them is used. Opaque, and never changed once handed out.
 *
 *   storage_base               storage that comes with the account
 *   storage_bonus              storage that was added to it
 *   storage_limit              both together
 *   storage_used               storage in use
 *   bandwidth_limit            bandwidth of the account
 *   bandwidth_used             how much of it is used
 *   collaboration_limit        shares that may be made in a day
 *   collaboration_today        shares made today
 *   one_time_downloads_limit   downloads by one-time links that a day allows
 *   one_time_downloads_today   such downloads today
 *   streaming_bandwidth_limit  bandwidth for streams in a day
 *   streaming_bandwidth_today  how much of it is used today
 *   upload_size_limit          greatest length of an upload
 */
typedef struct user_limits user_limits;

QM_API user_limits *
user_limits_new(const char *storage_base, const char *storage_bonus, const char *storage_limit,
                const char *storage_used, const char *bandwidth_limit, const char *bandwidth_used,
                const char *collaboration_limit, const char *collaboration_today,
                const char *one_time_downloads_limit, const char *one_time_downloads_today,
                const char *streaming_bandwidth_limit, const char *streaming_bandwidth_today,
                const char *upload_size_limit);
QM_API const char *user_limits_get_storage_base(const user_limits *record);
QM_API const char *user_limits_get_storage_bonus(const user_limits *record);
QM_API const char *user_limits_get_storage_limit(const user_limits *record);
QM_API const char *user_limits_get_storage_used(const user_limits *record);
QM_API const char *user_limits_get_bandwidth_limit(const user_limits *record);
QM_API const char *user_limits_get_bandwidth_used(const user_limits *record);
QM_API const char *user_limits_get_collaboration_limit(const user_limits *record);
QM_API const char *user_limits_get_collaboration_today(const user_limits *record);
QM_API const char *user_limits_get_one_time_downloads_limit(const user_limits *record);
QM_API const char *user_limits_get_one_time_downloads_today(const user_limits *record);
QM_API const char *user_limits_get_streaming_bandwidth_limit(const user_limits *record);
QM_API const char *user_limits_get_streaming_bandwidth_today(const user_limits *record);
QM_API const char *user_limits_get_upload_size_limit(const user_limits *record);
QM_API void user_limits_delete(user_limits **record);

/**
 * Limits of the service as a whole. Opaque, and never changed once handed out.
 *
 *   max_objects                files and folders in one request
 *   max_keys                   keys in one request
 *   max_image_size             greatest length of an image
 *   zip_max_filesize           greatest length of a file in an archive to download
 *   zip_max_total_filesize     greatest length of all files in such an archive
 *   folder_content_chunk_size  entries in a chunk of a listing
 *   folder_depth_limit         levels of folders below the root
 *   limit_search_results       entries that a search finds
 *   daily_shares_limit         shares that an account may make in a day
 *   device_changes_list_limit  changes in one reply of the change feed
 */
typedef struct system_limits system_limits;

QM_API system_limits *
system_limits_new(const char *max_objects, const char *max_keys, const char *max_image_size,
                  const char *zip_max_filesize, const char *zip_max_total_filesize,
                  const char *folder_content_chunk_size, const char *folder_depth_limit,
                  const char *limit_search_results, const char *daily_shares_limit,
                  const char *device_changes_list_limit);
QM_API const char *system_limits_get_max_objects(const system_limits *record);
QM_API const char *system_limits_get_max_keys(const system_limits *record);
QM_API const char *system_limits_get_max_image_size(const system_limits *record);
QM_API const char *system_limits_get_zip_max_filesize(const system_limits *record);
QM_API const char *system_limits_get_zip_max_total_filesize(const system_limits *record);
QM_API const char *system_limits_get_folder_content_chunk_size(const system_limits *record);
QM_API const char *system_limits_get_folder_depth_limit(const system_limits *record);
QM_API const char *system_limits_get_limit_search_results(const system_limits *record);
QM_API const char *system_limits_get_daily_shares_limit(const system_limits *record);
QM_API const char *system_limits_get_device_changes_list_limit(const system_limits *record);
QM_API void system_limits_delete(system_limits **record);

/**
 * Health of the service's back ends. Opaque, and never changed once handed out.
 *
 *   database  state of the database
 *   memcache  state of the cache
 */
typedef struct system_status system_status;

QM_API system_status *system_status_new(const char *database, const char *memcache);
QM_API const char *system_status_get_database(const system_status *record);
QM_API const char *system_status_get_memcache(const system_status *record);
QM_API void system_status_delete(system_status **record);

/**
 * One entry of the device change feed. Opaque, and never changed once handed out.
 *
 *   key               quick key of a file, or folder key of a folder
 *   parent_folderkey  key of the folder that it lies in
 *   created           when it was made
 *   revision          the revision of the account in which it changed
 *   is_folder         1 for a folder, 0 for a file
 *   changetype        1 for what was created or changed, 0 for what was deleted
 *   filename          its name
 *   mimetype          media type of a file
 *   filetype          the kind of file that it is
 */
typedef struct change_info change_info;

QM_API change_info *change_info_new(const char *key, const char *parent_folderkey,
                                    const char *created, uint64_t revision, int32_t is_folder,
                                    int32_t changetype, const char *filename, const char *mimetype,
                                    const char *filetype);
QM_API const char *change_info_get_key(const change_info *record);
QM_API const char *change_info_get_parent_folderkey(const change_info *record);
QM_API const char *change_info_get_created(const change_info *record);
QM_API uint64_t change_info_get_revision(const change_info *record);
QM_API int32_t change_info_get_is_folder(const change_info *record);
QM_API int32_t change_info_get_changetype(const change_info *record);
QM_API const char *change_info_get_filename(const change_info *record);
QM_API const char *change_info_get_mimetype(const change_info *record);
QM_API const char *change_info_get_filetype(const change_info *record);
QM_API void change_info_delete(change_info **record);

/**
 * The links of one file. Opaque, and never changed once handed out.
 *
 *   quickkey                         key of the file
 *   view                             link to look at it
 *   listen                           link to listen to it
 *   watch                            link to watch it
 *   normal_download                  link to the page from which it is downloaded
 *   direct_download                  link to its bytes
 *   direct_download_error_message    why there is no direct_download
 *   direct_download_error            the number of that
 *   edit                             link to edit it
 *   edit_error_message               why there is no edit
 *   one_time_download                link to its bytes that works once
 *   one_time_download_error_message  why there is no one_time_download
 *   error                            why there are no links at all
 */
typedef struct file_links file_links;

QM_API file_links *file_links_new(const char *quickkey, const char *view, const char *listen,
                                  const char *watch, const char *normal_download,
                                  const char *direct_download,
                                  const char *direct_download_error_message,
                                  const char *direct_download_error, const char *edit,
                                  const char *edit_error_message, const char *one_time_download,
                                  const char *one_time_download_error_message, const char *error);
QM_API const char *file_links_get_quickkey(const file_links *record);
QM_API const char *file_links_get_view(const file_links *record);
QM_API const char *file_links_get_listen(const file_links *record);
QM_API const char *file_links_get_watch(const file_links *record);
QM_API const char *file_links_get_normal_download(const file_links *record);
QM_API const char *file_links_get_direct_download(const file_links *record);
QM_API const char *file_links_get_direct_download_error_message(const file_links *record);
QM_API const char *file_links_get_direct_download_error(const file_links *record);
QM_API const char *file_links_get_edit(const file_links *record);
QM_API const char *file_links_get_edit_error_message(const file_links *record);
QM_API const char *file_links_get_one_time_download(const file_links *record);
QM_API const char *file_links_get_one_time_download_error_message(const file_links *record);
QM_API const char *file_links_get_error(const file_links *record);
QM_API void file_links_delete(file_links **record);

/* -------------------------------------------------------------------------------------------------
 * Lists of records
 *
 * A list is known by its first node, which holds no record: walk it from list->next. New records go
 * to the front, so what was added last, and stood last in a reply, comes first. A list owns its
 * nodes and their records. For each kind
 *
 *   <kind>_list_new        makes an empty list;
 *   add_to_<kind>_list     hands a record over to a list; does nothing if either is NULL;
 *   delete_all_<kind>_list deletes *list with all its records, and deliberately leaves the pointer
 *                          as it was. NULL, or a pointer to NULL, does nothing.
 * ---------------------------------------------------------------------------------------------- */

/** A node of a list of files. */
typedef struct file_list {
    file_info *record;      /**< Owned; NULL in the first node. */
    struct file_list *next; /**< NULL at the end. */
} file_list;

/** Makes such a list, hands a record over to it, deletes it with its records; see above. */
QM_API file_list *file_info_list_new(void);
QM_API void add_to_file_list(file_list *list, file_info *record);
QM_API void delete_all_file_list(file_list **list);

/** A node of a list of folders. */
typedef struct folder_list {
    folder_info *record;      /**< Owned; NULL in the first node. */
    struct folder_list *next; /**< NULL at the end. */
} folder_list;

/** Makes such a list, hands a record over to it, deletes it with its records; see above. */
QM_API folder_list *folder_info_list_new(void);
QM_API void add_to_folder_list(folder_list *list, folder_info *record);
QM_API void delete_all_folder_list(folder_list **list);

/** A node of a list of changes. */
typedef struct change_list {
    change_info *record;      /**< Owned; NULL in the first node. */
    struct change_list *next; /**< NULL at the end. */
} change_list;

/** Makes such a list, hands a record over to it, deletes it with its records; see above. */
QM_API change_list *change_list_new(void);
QM_API void add_to_change_list(change_list *list, change_info *record);
QM_API void delete_all_change_list(change_list **list);

/** A node of a list of the links of several files. */
typedef struct file_links_list {
    file_links *record;           /**< Owned; NULL in the first node. */
    struct file_links_list *next; /**< NULL at the end. */
} file_links_list;

/** Makes such a list, hands a record over to it, deletes it with its records; see above. */
QM_API file_links_list *file_links_list_new(void);
QM_API void add_to_file_links_list(file_links_list *list, file_links *record);
QM_API void delete_all_file_links_list(file_links_list **list);

/* -------------------------------------------------------------------------------------------------
 * Pairs of texts. The library hands out none; the type is there for applications.
 * ---------------------------------------------------------------------------------------------- */

/** A pair, and the list of those added after it. */
typedef struct key_value {
    char *key;              /**< Owned, or NULL. */
    char *value;            /**< Owned, or NULL. */
    struct key_value *next; /**< The pair added next, or NULL. */
} key_value;

/** Makes a list of one pair, with copies of the texts, either of which may be NULL. */
QM_API key_value *key_value_new(const char *key, const char *value);

/** Adds a pair at the end of the list and returns its node; NULL if the list is NULL. Walks the
 * whole list. */
QM_API key_value *key_value_add(key_value *list, const char *key, const char *value);

/** The node that follows, or NULL at the end or for NULL. */
QM_API key_value *key_value_get_next_pair(const key_value *pair);

/** The texts of a pair, borrowed. Deliberately, and unlike the getters of records, these do not
 * take NULL. */
QM_API const char *key_value_get_key(const key_value *pair);
QM_API const char *key_value_get_value(const key_value *pair);

/** Frees a list from the given node on. NULL does nothing. */
QM_API void key_value_delete(key_value *list);

/* -------------------------------------------------------------------------------------------------
 * Reading lists from replies. The operations use these.
 *
 * Each takes a reply and its length, of which only the low 32 bits count, and lists of the
 * caller's, and makes one record for each entry, in the reply's order. An entry's texts are those
 * of the elements inside it, at any depth; an element that occurs twice has its texts joined. They
 * return 1 if the reply is not well-formed, else 0; the records finished before the damage stay in
 * the lists and are counted. A reply that is NULL or of length 0 returns 0 and touches nothing. Any
 * thread.
 *
 * The callbacks below are expat's, for a start tag, an end tag and text, and take the state of
 * their extractor.
 * ---------------------------------------------------------------------------------------------- */

/** State of simple_extract_folders_content(). */
typedef struct folder_content_state {
    file_info *current_file;     /**< File being read, or NULL. */
    folder_info *current_folder; /**< Folder being read, or NULL. */
    file_list *files;            /**< The caller's. */
    folder_list *folders;        /**< The caller's. */
    int32_t mode;                /**< 0 outside an entry, 1 in a folder, 2 in a file. */
    char *current_element;       /**< Name of the element whose text comes next, owned, or NULL. */
    int32_t file_count;          /**< Files added to the list. */
    int32_t folder_count;        /**< Folders added to the list. */
} folder_content_state;

/** Reads the elements "folder" and "file", at any depth. */
QM_API uint32_t simple_extract_folders_content(const char *xml, uint64_t length,
                                               folder_list *folders, int32_t *folder_count,
                                               file_list *files, int32_t *file_count);
QM_API void simple_extract_folders_node_value_start(void *state, const char *element,
                                                    const char **attributes);
QM_API void simple_extract_folders_node_value_end(void *state, const char *element);
QM_API void simple_extract_folders_node_value_data(void *state, const char *text, int32_t length);

/** State of simple_extract_changes(). */
typedef struct changes_state {
    void *parser;                /**< The expat parser (XML_Parser), which a callback may stop. */
    change_info *current_change; /**< Change being read. */
    change_list *changes;        /**< The caller's. */
    char *current_element;       /**< Name of the element whose text comes next, owned, or NULL. */
    int32_t change_count;        /**< Changes added to the list. */
    int32_t change_type;         /**< 1 after "updated", 0 after "deleted" and at the start. */
    int32_t object_kind;         /**< 1 after "folders", 0 after "files" and at the start. */
    int32_t in_object;           /**< 1 while a change is being read. */
} changes_state;

/**
 * Reads the elements "file" and "folder" below "updated" and "deleted", "files" and "folders". One
 * inside another stops the reading, is logged, and counts as damage.
 */
QM_API uint32_t simple_extract_changes(const char *xml, uint64_t length, change_list *changes,
                                       uint32_t *change_count);
QM_API void simple_extract_changes_node_value_start(void *state, const char *element,
                                                    const char **attributes);
QM_API void simple_extract_changes_node_value_end(void *state, const char *element);
QM_API void simple_extract_changes_node_value_data(void *state, const char *text, int32_t length);

/** State of simple_extract_file_links(). */
typedef struct links_state {
    file_links *current_link; /**< Link record being read, or NULL. */
    file_links_list *links;   /**< The caller's. */
    int32_t in_link;          /**< 1 while a link record is being read. */
    char *current_element;    /**< Name of the element whose text comes next, owned, or NULL. */
    int32_t link_count;       /**< Link records added to the list. */
} links_state;

/** Reads the elements "link". */
QM_API uint32_t simple_extract_file_links(const char *xml, uint64_t length, file_links_list *links,
                                          int32_t *link_count);
QM_API void simple_extract_links_node_value_start(void *state, const char *element,
                                                  const char **attributes);
QM_API void simple_extract_links_node_value_end(void *state, const char *element);
QM_API void simple_extract_links_node_value_data(void *state, const char *text, int32_t length);

/* -------------------------------------------------------------------------------------------------
 * Operations
 *
 * Each performs one exchange on urls[1], blocks until it is over, and may be called on any thread
 * between api_global_init() and api_global_cleanup(). What they have in common:
 *
 *   - The path of the request stands in an exported variable, the operation's name with _uri, which
 *     is read at every call and may be changed. The library never frees it.
 *   - A session token is sent as it is; other texts are percent-encoded where the operation does
 *     not say otherwise.
 *   - error_message receives the message of a failure or NULL, and is the caller's to free.
 *     QM_NO_RESPONSE and QM_UNUSABLE_RESPONSE come with a message of the library's, service errors
 *     with the service's own.
 *   - The status is QM_OK; the service's own error number (positive); QM_NO_RESPONSE;
 *     QM_UNUSABLE_RESPONSE; QM_UNUSABLE_ERROR_NUMBER; or QM_MALFORMED_REPLY, which overrides the
 *     others. Records are handed out only with QM_OK.
 *   - URLs (session tokens included) and replies are written to the diagnostic log. Only passwords,
 *     Facebook access tokens and signatures are left out of it.
 * ---------------------------------------------------------------------------------------------- */

/**
 * Authentication. The application id is sent; the application key only enters the SHA-1 signature
 * of a request. In all three operations the last out-parameter receives the token when the status
 * is QM_OK, and otherwise the error message, if there is one. The caller frees either.
 */
extern QM_API const char *get_session_token_uri;   /**< "/api/user/get_session_token.php" */
extern QM_API const char *get_login_token_uri;     /**< "/api/user/get_login_token.php" */
extern QM_API const char *renew_session_token_uri; /**< "/api/user/renew_session_token.php" */

/**
 * Trades the user's credentials for a session token.
 *
 * @param email                 e-mail address, or NULL or ""
 * @param password              password, or NULL or ""
 * @param fb_access_token       Facebook access token, or NULL or ""; used unless both email and
 *                              password are given
 * @param application_id        id of the application
 * @param application_key       key of the application, never sent nor logged
 * @param session_token_or_error receives the session token, or the error message
 * @return a status; QM_UNUSABLE_RESPONSE also for a "Success" without a token, and
 *         QM_SIGNATURE_FAILED
 *
 * With QM_MALFORMED_REPLY a token that stood in the reply before the damage is handed out all the
 * same.
 */
QM_API int32_t get_session_token(const char *email, const char *password,
                                 const char *fb_access_token, const char *application_id,
                                 const char *application_key, char **session_token_or_error);

/**
 * Trades e-mail address and password for a one-time login token.
 *
 * @param email                e-mail address
 * @param password             password
 * @param application_id       id of the application
 * @param application_key      key of the application, never sent nor logged
 * @param pkey                 receives the reply's "pkey" or NULL, also when the login is refused;
 *                             the caller frees it. Left as it was when no reply arrives. Must point
 *                             to a slot from malloc(): with QM_MALFORMED_REPLY, deliberately, the
 *                             slot itself is freed (and what it held is not)
 * @param login_token_or_error receives the login token, or the error message; transport failures
 *                             have none
 * @return a status; a negative response code counts as QM_UNUSABLE_RESPONSE here, as does a
 *         "Success" without a token; QM_SIGNATURE_FAILED
 */
QM_API int32_t get_login_token(const char *email, const char *password, const char *application_id,
                               const char *application_key, char **pkey,
                               char **login_token_or_error);

/**
 * Trades a session token for a fresh one.
 *
 * @param session_token          the current token
 * @param session_token_or_error receives the new token, or the error message; transport failures
 *                               have none
 * @return a status; QM_UNUSABLE_RESPONSE also for a "Success" without a token
 *
 * Deliberately, the URL is not logged.
 */
QM_API int32_t renew_session_token(const char *session_token, char **session_token_or_error);

/** System and device status. */
extern QM_API const char *get_system_limits_uri; /**< "/api/system/get_limits.php" */
extern QM_API const char *get_system_status_uri; /**< "/api/system/get_status.php" */
extern QM_API const char *get_device_status_uri; /**< "/api/device/get_status.php" */

/**
 * Reads the limits of the service. Needs no session.
 *
 * @param limits receives the record or NULL; the caller deletes it
 */
QM_API int32_t get_system_limits(system_limits **limits, char **error_message);

/**
 * Reads the health of the service's back ends. Needs no session.
 *
 * @param status receives the record or NULL; the caller deletes it
 */
QM_API int32_t get_system_status(system_status **status, char **error_message);

/**
 * Reads whether the account has changed, and whether the service is still at work on it.
 *
 * @param session_token          the session
 * @param device_id              id of the device
 * @param device_revision        receives the revision of the account's file tree, or 0
 * @param async_jobs_in_progress receives 1 if background jobs are running, else 0
 *
 * With QM_MALFORMED_REPLY the two numbers may have been set.
 */
QM_API int32_t get_device_status(const char *session_token, uint32_t device_id,
                                 uint64_t *device_revision, int32_t *async_jobs_in_progress,
                                 char **error_message);

/** The account. */
extern QM_API const char *get_user_info_uri;    /**< "/api/user/get_info.php" */
extern QM_API const char *get_user_limits_uri;  /**< "/api/user/get_limits.php" */
extern QM_API const char *myfiles_revision_uri; /**< "/api/user/myfiles_revision.php" */

/**
 * Reads the account's profile, its storage figures and its linked social accounts.
 *
 * @param session_token the session
 * @param info          receives the record or NULL; the caller deletes it
 */
QM_API int32_t get_user_info(const char *session_token, user_info **info, char **error_message);

/**
 * Reads the account's quotas and their use.
 *
 * @param session_token the session
 * @param limits        receives the record or NULL; the caller deletes it
 */
QM_API int32_t get_user_limits(const char *session_token, user_limits **limits,
                               char **error_message);

/**
 * Reads the revision and epoch of the account's file tree.
 *
 * @param session_token the session
 * @param revision      receives the revision as text, or NULL; the caller frees it
 * @param epoch         receives the epoch as text, or NULL; the caller frees it
 * @return a status; QM_OK needs only one of the two, and QM_UNUSABLE_RESPONSE means that neither
 *         came. A negative response code counts as QM_UNUSABLE_RESPONSE here
 *
 * Deliberately, nothing is logged, and transport failures have no message.
 */
QM_API int32_t get_myfiles_revision(const char *session_token, char **revision, char **epoch,
                                    char **error_message);

/** Folders. */
extern QM_API const char *get_folder_info_uri;    /**< "/api/folder/get_info.php" */
extern QM_API const char *create_folder_uri;      /**< "/api/folder/create.php" */
extern QM_API const char *delete_folder_uri;      /**< "/api/folder/delete.php" */
extern QM_API const char *update_folder_uri;      /**< "/api/folder/update.php" */
extern QM_API const char *copy_folder_uri;        /**< "/api/folder/copy.php" */
extern QM_API const char *move_folder_uri;        /**< "/api/folder/move.php" */
extern QM_API const char *get_folder_content_uri; /**< "/api/1.0/folder/get_content.php" */
extern QM_API const char *attach_foreign_uri;     /**< "/api/folder/attach_foreign.php" */
extern QM_API const char *detach_foreign_uri;     /**< "/api/folder/detach_foreign.php" */

/**
 * Reads what the service knows of a folder.
 *
 * @param session_token the session, or NULL; sent as it is
 * @param folder_key    the folder, or NULL; sent as it is
 * @param device_id     a device id, or NULL; sent as it is
 * @param details       the kind of details, sent as it is; NULL or "" asks for "yes"
 * @param error_message deliberately ahead of the result
 * @param info          receives the record or NULL; the caller deletes it
 * @return a status, QM_NO_ERROR_ELEMENT among them
 */
QM_API int32_t get_folder_info(const char *session_token, const char *folder_key,
                               const char *device_id, const char *details, char **error_message,
                               folder_info **info);

/**
 * Creates a folder, unless its name is taken there.
 *
 * @param session_token the session
 * @param name          name of the folder
 * @param parent_key    folder to create it in; NULL or "" for the account's root
 * @param mtime         modification time; NULL or "" for none
 * @param folder_key    receives the new folder's key, or NULL if the call failed or the reply named
 *                      none; the caller frees it
 */
QM_API int32_t create_folder(const char *session_token, const char *name, const char *parent_key,
                             const char *mtime, char **folder_key, char **error_message);

/** Deletes a folder and all that it holds. */
QM_API int32_t delete_folder(const char *session_token, const char *folder_key,
                             char **error_message);

/**
 * Changes a folder's metadata.
 *
 * @param session_token     the session
 * @param folder_key        the folder
 * @param name              new name; NULL or "" leaves it
 * @param description       new description; NULL leaves it, "" clears it
 * @param tags              new tags; NULL leaves them, "" clears them
 * @param privacy           -1 public, 1 private; any other value leaves it
 * @param privacy_recursive with a new privacy: non-zero applies it to all that the folder holds
 * @param mtime             modification time; NULL or "" leaves it
 */
QM_API int32_t update_folder(const char *session_token, const char *folder_key, const char *name,
                             const char *description, const char *tags, int32_t privacy,
                             int32_t privacy_recursive, const char *mtime, char **error_message);

/**
 * Copies a folder and everything in it into another folder.
 *
 * @param session_token   the session
 * @param source_key      the folder to copy, sent as it is
 * @param destination_key the receiving folder, sent as it is, or NULL to leave it out of the
 *                        request
 * @param new_folder_key  receives the key of the copy, or NULL if the call failed or the reply
 *                        named none; the caller frees it
 * @return a status, QM_NO_ERROR_ELEMENT among them
 */
QM_API int32_t copy_folder(const char *session_token, const char *source_key,
                           const char *destination_key, char **new_folder_key,
                           char **error_message);

/**
 * Moves a folder and everything in it into another folder.
 *
 * @param session_token   the session
 * @param source_key      the folder to move, sent as it is
 * @param destination_key the receiving folder, sent as it is, or NULL to leave it out of the
 *                        request
 * @return a status, QM_NO_ERROR_ELEMENT among them
 */
QM_API int32_t move_folder(const char *session_token, const char *source_key,
                           const char *destination_key, char **error_message);

/**
 * Reads one chunk of a folder's listing. All texts are sent as they are; each may be NULL, which
 * leaves it out, while "" is sent.
 *
 * @param session_token the session
 * @param folder_key    the folder
 * @param device_id     a device id
 * @param chunk         number of the chunk, as text
 * @param content_type  the kind of entries asked for
 * @param error_message deliberately ahead of the results
 * @param folders       receives the chunk's folders, or NULL if there are none; the caller deletes
 *                      the list
 * @param folder_count  receives their number
 * @param files         receives the chunk's files, or NULL if there are none; the caller deletes
 *                      the list
 * @param file_count    receives their number
 * @param chunk_size    receives the most entries that a chunk holds, 100 if the reply does not say
 * @return a status, QM_NO_ERROR_ELEMENT among them. With QM_MALFORMED_REPLY both lists are NULL,
 *         but the numbers may have been set
 */
QM_API int32_t get_folder_content(const char *session_token, const char *folder_key,
                                  const char *device_id, const char *chunk,
                                  const char *content_type, char **error_message,
                                  folder_list **folders, int32_t *folder_count, file_list **files,
                                  int32_t *file_count, int32_t *chunk_size);

/**
 * Attaches another account's folder to this account, or detaches it again. Both texts are sent as
 * they are.
 *
 * @param session_token the session
 * @param folder_key    the foreign folder
 * @return a status, QM_NO_ERROR_ELEMENT among them
 */
QM_API int32_t attach_foreign_folder(const char *session_token, const char *folder_key,
                                     char **error_message);
QM_API int32_t detach_foreign_folder(const char *session_token, const char *folder_key,
                                     char **error_message);

/** Files. */
extern QM_API const char *get_file_info_uri; /**< "/api/file/get_info.php" */
extern QM_API const char *create_file_uri;   /**< "/api/file/create.php" */
extern QM_API const char *delete_file_uri;   /**< "/api/file/delete.php" */
extern QM_API const char *copy_file_uri;     /**< "/api/file/copy.php" */
extern QM_API const char *move_file_uri;     /**< "/api/file/move.php" */

/**
 * Reads what the service knows of a file.
 *
 * @param quick_key     the file, deliberately ahead of the session; sent as it is
 * @param session_token the session, or NULL
 * @param error_message deliberately ahead of the result
 * @param info          receives the record or NULL; the caller deletes it
 */
QM_API int32_t get_file_info(const char *quick_key, const char *session_token, char **error_message,
                             file_info **info);

/**
 * Creates an empty file.
 *
 * @param session_token  the session
 * @param filename       name, or NULL
 * @param file_extension extension, or NULL
 * @param parent_key     folder to create it in, or NULL
 * @param mtime          modification time; NULL or "" for none
 * @param quick_key      receives the new file's key, or NULL if the call failed or the reply named
 *                       none; the caller frees it
 */
QM_API int32_t create_file(const char *session_token, const char *filename,
                           const char *file_extension, const char *parent_key, const char *mtime,
                           char **quick_key, char **error_message);

/** Deletes a file. The quick key is sent as it is. */
QM_API int32_t delete_file(const char *session_token, const char *quick_key, char **error_message);

/**
 * Copies a file into another folder.
 *
 * @param session_token the session
 * @param quick_key     the file, sent as it is
 * @param folder_key    the receiving folder, or NULL to leave it out of the request
 * @param new_quick_key receives the key of the copy, or NULL if the call failed or the reply named
 *                      none; the caller frees it
 */
QM_API int32_t copy_file(const char *session_token, const char *quick_key, const char *folder_key,
                         char **new_quick_key, char **error_message);

/**
 * Moves a file into another folder.
 *
 * @param session_token the session
 * @param quick_key     the file, sent as it is
 * @param folder_key    the receiving folder, or NULL to leave it out of the request
 */
QM_API int32_t move_file(const char *session_token, const char *quick_key, const char *folder_key,
                         char **error_message);

/** Links of files. Both operations ask the same endpoint. */
extern QM_API const char *get_links_uri;         /**< "/api/file/get_links.php" */
extern QM_API const char *get_download_link_uri; /**< "/api/file/get_links.php" */

/**
 * Reads the links of a file.
 *
 * @param quick_key     the file, or several with commas between; deliberately percent-encoded here
 * @param link_type     the kind of link; NULL or "" for all
 * @param session_token the session; NULL or "" for none
 * @param links         receives the links, or NULL if there are none; the caller deletes the list
 * @param link_count    receives their number, which stays set with QM_MALFORMED_REPLY
 */
QM_API int32_t get_links(const char *quick_key, const char *link_type, const char *session_token,
                         file_links_list **links, int32_t *link_count, char **error_message);

/**
 * Reads the link under which a file's bytes can be fetched.
 *
 * @param session_token          the session
 * @param quick_key              the file, sent as it is
 * @param download_url           receives the link, or NULL if there is none; a link without a
 *                               scheme is given "http". The caller frees it
 * @param free_bandwidth         receives the bandwidth that is left for free downloads, or 0
 * @param error_message          deliberately between the two pairs of results
 * @param download_error         receives the number of a refusal of the download, or 0
 * @param download_error_message receives that refusal's message or NULL; the caller frees it
 * @return a status; QM_OK says nothing of the link: see download_url and download_error. With
 *         QM_MALFORMED_REPLY the two texts are NULL, but the numbers may have been set
 */
QM_API int32_t get_download_link(const char *session_token, const char *quick_key,
                                 char **download_url, int32_t *free_bandwidth, char **error_message,
                                 int32_t *download_error, char **download_error_message);

/** The device change feed. */
extern QM_API const char *get_device_changes_uri; /**< "/api/device/get_changes.php" */

/**
 * Reads everything that changed in the account after a revision.
 *
 * @param session_token   the session
 * @param revision        the revision up to which the caller is up to date
 * @param device_id       id of the device
 * @param device_revision receives the account's revision now, or 0
 * @param changes         receives the list of changes, which may be empty, or NULL; the caller
 *                        deletes it. With QM_MALFORMED_REPLY, deliberately, it may point to a list
 *                        that has been deleted already: do not touch it
 * @param change_count    receives the number of changes
 * @param block_size      receives the number of revisions of which the service hands out changes at
 *                        once, or 0
 *
 * With QM_MALFORMED_REPLY the numbers may have been set.
 */
QM_API int32_t get_device_changes(const char *session_token, uint64_t revision, uint32_t device_id,
                                  uint64_t *device_revision, change_list **changes,
                                  uint32_t *change_count, int32_t *block_size,
                                  char **error_message);

/**
 * Does as get_device_changes() does, but reads a reply that is built into the library instead of
 * asking the service: a feed of 17 changes up to revision 59. The block size stays 0, deliberately.
 *
 * @return QM_OK
 */
QM_API int32_t test_get_device_changes(const char *session_token, uint64_t revision,
                                       uint32_t device_id, uint64_t *device_revision,
                                       change_list **changes, uint32_t *change_count,
                                       int32_t *block_size, char **error_message);

/** Uploads. */
extern QM_API const char *update_file_uri; /**< "/api/file/update.php" */

/**
 * Makes the URL to which a new file is uploaded. Nothing is encoded.
 *
 * @param session_token the session
 * @param upload_key    key of an upload to go on with, or NULL
 * @param use_tls       non-zero for urls[3], else urls[2]
 * @return the URL, the caller's to free; NULL if session_token is NULL. Any thread.
 */
QM_API char *get_upload_url(const char *session_token, const char *upload_key, int32_t use_tls);

/**
 * Makes the URL to which a new revision of a file is uploaded. Nothing is encoded.
 *
 * @param session_token the session
 * @param quick_key     the file
 * @param revision      the revision that the change is based on
 * @param target_hash   digest of the new revision, in hexadecimal
 * @param target_size   its size in bytes
 * @param use_tls       non-zero for urls[3], else urls[2]
 * @return the URL, the caller's to free; NULL if session_token is NULL. Any thread.
 */
QM_API char *get_patch_upload_url(const char *session_token, const char *quick_key,
                                  uint64_t revision, const char *target_hash, uint64_t target_size,
                                  int32_t use_tls);

/**
 * Reads the upload server's raw reply, HTTP headers and all.
 *
 * @param reply      the bytes that were received
 * @param length     their number
 * @param upload_key receives the upload's key or NULL, also for a refused upload; the caller frees
 *                   it
 * @return 0 if the upload was accepted; -1 if not, or if the reply is shorter than 4 bytes;
 *         QM_MALFORMED_REPLY. Any thread.
 */
QM_API int32_t parse_upload_response(const char *reply, uint64_t length, char **upload_key);

/**
 * Changes a file's metadata. Deliberately, the request goes to urls[0], the plain base address.
 *
 * @param session_token the session
 * @param quick_key     the file
 * @param filename      new name; NULL or "" leaves it
 * @param description   new description; NULL leaves it, "" clears it
 * @param tags          new tags; NULL leaves them, "" clears them
 * @param privacy       new privacy; NULL or "" leaves it
 * @param mtime         modification time; NULL or "" leaves it
 * @param message       receives the message of a failure or NULL; the caller frees it
 * @return as make_api_call()
 */
QM_API int32_t update_file(const char *session_token, const char *quick_key, const char *filename,
                           const char *description, const char *tags, const char *privacy,
                           const char *mtime, char **message);

/* -------------------------------------------------------------------------------------------------
 * Additions: off by default, so that an application which knows nothing of them sees no difference.
 * ---------------------------------------------------------------------------------------------- */

/**
 * The version of the library that runs, such as "0.1.0". It may be newer than this header, whose
 * version the macros at its head tell.
 *
 * @return a text that is never freed. Any thread, at any time.
 */
QM_API const char *quillmere_version(void);

/**
 * Limits the length of a response's body, so that a broken or hostile server cannot fill the
 * memory. Past the limit an attempt fails as any other does: one line of the log says that the
 * response is too long, libcurl's own line follows, and what was received is dropped. A response of
 * exactly that length is taken. It does not concern the connections of send_file_new().
 *
 * @param bytes the most bytes that are taken; 0, the initial value, for no limit
 * @return 0, or 1 for a negative value: that is logged, and the setting stays. Configuration; it
 *         outlasts api_global_cleanup().
 */
QM_API int32_t set_response_limit(int64_t bytes);

/**
 * Has the requests of the operations, of get_response_from_url() and of make_api_call() keep their
 * connections for later requests, which then need no handshake. Off initially: each request has a
 * connection of its own. The probes and the connections of send_file_new() are not concerned.
 *
 * What it costs:
 *   - Up to 16 sets of idle connections stay open, as many as there were requests at the same time,
 *     until a later request finds them too old, they are switched off, or the library stops. No
 *     thread looks after them meanwhile.
 *   - A connection that the server has closed is replaced, which neither counts as an attempt nor
 *     is logged. If it ended while a request was on it, before any answer, the request is sent once
 *     more, even with a single attempt: the service may see it twice.
 *   - A connection that vanished without a word, such as in a gateway, is only noticed by the
 *     time-out, which counts as an attempt. The next attempt has a new connection.
 *   - A server is verified when a connection is made, and not again on every request.
 *
 * All are closed when the certificate file (its path or its content), the proxy settings or
 * ssl_disabled have changed. After a fork() the child makes connections of its own and leaves the
 * parent's alone. Without being able to read the certificate file, nothing is kept.
 *
 * @param enabled non-zero to keep connections; 0 to close those that are kept, too
 *
 * Configuration; it outlasts api_global_cleanup(), which closes what is kept.
 */
QM_API void set_connection_reuse(int32_t enabled);

#ifdef __cplusplus
}
#endif

#endif
