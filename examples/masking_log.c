#define _GNU_SOURCE /* fopencookie() */
#include "masking_log.h"

#include <stdlib.h>
#include <string.h>
#include <strings.h>

#define LONGEST_NAME 64

/* What stands at the place that the stream has reached. Messages arrive in pieces, so the stream
 * has to remember it between them. */
enum place {
    IN_TEXT,         /* nothing secret */
    BEFORE_VALUE,    /* just behind "session_token=" */
    IN_VALUE,        /* the value, up to what cannot be a part of it */
    IN_REST_OF_LINE, /* a value in quotation marks, and all behind it */
    IN_TAG,          /* in "<session_token ...", before its ">" */
    IN_ELEMENT       /* the text of the element, up to its end tag */
};

struct masking_log {
    FILE *to;
    enum place place;
    char name[LONGEST_NAME + 1]; /* the letters up to here, or the last of them */
    size_t name_length;
    int is_tag;       /* a "<" stands before the name */
    char last_in_tag; /* tells "<name/>" from "<name>" */
    char end_tag[LONGEST_NAME + 4];
    size_t end_tag_matched;
};

/* Names are told by their ends: session_token, fb_access_token, login_token, ... */
static int is_secret(const struct masking_log *log)
{
    static const char *const endings[] = {"token",      "password", "signature",      "secret",
                                          "secret_key", "pkey",     "application_key"};
    for (size_t each = 0; each < sizeof endings / sizeof *endings; ++each) {
        const size_t length = strlen(endings[each]);
        if (log->name_length >= length &&
            strcasecmp(log->name + log->name_length - length, endings[each]) == 0)
            return 1;
    }
    return 0;
}

static int is_name_letter(char letter)
{
    return (letter >= 'a' && letter <= 'z') || (letter >= 'A' && letter <= 'Z') ||
           (letter >= '0' && letter <= '9') || letter == '_';
}

static int ends_value(char letter)
{
    return (unsigned char)letter <= ' ' || strchr("&\"'<>", letter) != NULL;
}

static void take_name_letter(struct masking_log *log, char letter)
{
    if (log->name_length == LONGEST_NAME) /* the end of a name is what counts */
        memmove(log->name, log->name + 1, --log->name_length);
    log->name[log->name_length++] = letter;
    log->name[log->name_length] = '\0';
}

static void enter_element(struct masking_log *log)
{
    fputs("(masked)", log->to);
    log->end_tag_matched = 0;
    log->place = IN_ELEMENT;
}

static void end_name(struct masking_log *log, char letter)
{
    const int secret = is_secret(log);
    if (secret && letter == '=') {
        log->place = BEFORE_VALUE;
    } else if (secret && log->is_tag && (letter == '>' || (unsigned char)letter <= ' ')) {
        snprintf(log->end_tag, sizeof log->end_tag, "</%s", log->name);
        log->last_in_tag = letter;
        log->place = IN_TAG;
        if (letter == '>')
            enter_element(log);
    }
    log->is_tag = letter == '<';
    log->name_length = 0;
}

static void pass_text(struct masking_log *log, char letter)
{
    fputc(letter, log->to);
    if (is_name_letter(letter))
        take_name_letter(log, letter);
    else
        end_name(log, letter);
}

static void pass_value(struct masking_log *log, char letter)
{
    if (log->place == BEFORE_VALUE && (letter == '"' || letter == '\'')) {
        fputs("(masked)", log->to);
        log->place = IN_REST_OF_LINE;
    } else if (ends_value(letter)) {
        log->place = IN_TEXT;
        pass_text(log, letter);
    } else if (log->place == BEFORE_VALUE) {
        fputs("(masked)", log->to);
        log->place = IN_VALUE;
    }
}

/* Replies of the service have no such values, and in what others send instead a quotation mark may
 * be missing: nothing but the end of the line is a safe end. */
static void pass_rest_of_line(struct masking_log *log, char letter)
{
    if (letter != '\n')
        return;
    fputc(letter, log->to);
    log->place = IN_TEXT;
}

static void pass_tag(struct masking_log *log, char letter)
{
    if (letter == '>' && log->last_in_tag == '/') {
        fputs("/>", log->to);
        log->place = IN_TEXT;
    } else if (letter == '>') {
        fputc(letter, log->to);
        enter_element(log);
    }
    log->last_in_tag = letter;
}

/* A reply that is cut off within the element takes the rest of the log with it: the safe side. */
static void pass_element(struct masking_log *log, char letter)
{
    if (letter == log->end_tag[log->end_tag_matched])
        ++log->end_tag_matched;
    else
        log->end_tag_matched = letter == '<';
    if (log->end_tag[log->end_tag_matched] != '\0')
        return;
    fputs(log->end_tag, log->to);
    log->place = IN_TEXT;
}

static void pass(struct masking_log *log, char letter)
{
    switch (log->place) {
    case IN_TEXT:
        pass_text(log, letter);
        break;
    case BEFORE_VALUE:
    case IN_VALUE:
        pass_value(log, letter);
        break;
    case IN_REST_OF_LINE:
        pass_rest_of_line(log, letter);
        break;
    case IN_TAG:
        pass_tag(log, letter);
        break;
    case IN_ELEMENT:
        pass_element(log, letter);
        break;
    }
}

static ssize_t write_masked(void *cookie, const char *bytes, size_t count)
{
    struct masking_log *log = cookie;
    for (size_t at = 0; at < count; ++at)
        pass(log, bytes[at]);
    fflush(log->to);
    return (ssize_t)count; /* less would make the library's messages fail */
}

static int close_log(void *cookie)
{
    free(cookie);
    return 0;
}

FILE *masking_log_new(FILE *to)
{
    const cookie_io_functions_t functions = {.write = write_masked, .close = close_log};
    struct masking_log *log = calloc(1, sizeof *log);
    if (log == NULL)
        return NULL;
    log->to = to;
    FILE *stream = fopencookie(log, "w", functions);
    if (stream == NULL)
        free(log);
    return stream;
}
