/*
 * The SEL of the SEL behaviour module: records oldest first, the ring or
 * refusing fill, the background erase, and the file it is kept in.
 */
#include "sel_store.h"

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

struct sel_state selb_state;

unsigned selb_record_id(const unsigned char* record)
{
    return record[0] | (unsigned)record[1] << 8;
}

uint32_t selb_time(void)
{
    return (uint32_t)(time(NULL) + selb_state.clock_offset);
}

void selb_put16(unsigned char* out, unsigned value)
{
    out[0] = value & 0xff;
    out[1] = (value >> 8) & 0xff;
}

void selb_put32(unsigned char* out, uint32_t value)
{
    out[0] = value & 0xff;
    out[1] = (value >> 8) & 0xff;
    out[2] = (value >> 16) & 0xff;
    out[3] = (value >> 24) & 0xff;
}

void selb_save(void)
{
    char temporary[1100];
    FILE* out;
    unsigned i;
    unsigned j;
    snprintf(temporary, sizeof temporary, "%s.new", selb_state.path);
    out = fopen(temporary, "w");
    if (!out)
    {
        fprintf(stderr, "sel module: cannot write %s\n", temporary);
        return;
    }
    fprintf(out, "next-id %u\nlast-add %u\nlast-erase %u\n", selb_state.next_id,
            (unsigned)selb_state.last_add, (unsigned)selb_state.last_erase);
    for (i = 0; i < selb_state.count; ++i)
    {
        for (j = 0; j < RECORD_SIZE; ++j)
        {
            fprintf(out, j + 1 < RECORD_SIZE ? "%02x " : "%02x\n",
                    selb_state.records[i][j]);
        }
    }
    if (fclose(out) != 0 || rename(temporary, selb_state.path) != 0)
    {
        fprintf(stderr, "sel module: cannot replace %s\n", selb_state.path);
    }
}

/* Parses a whole unsigned number in @p base; 0 when it is not one. */
static int parse_number(const char* text, int base, unsigned long limit,
                        unsigned long* value)
{
    char* end = NULL;
    errno = 0;
    *value = strtoul(text, &end, base);
    return errno == 0 && end != text && *end == '\0' && *value <= limit &&
           text[0] != '-';
}

/* "name value": the value when @p line is that setting. */
static int setting(char* line, const char* name, unsigned long* value)
{
    const size_t length = strlen(name);
    return strncmp(line, name, length) == 0 && line[length] == ' ' &&
           parse_number(line + length + 1, 10, 0xffffffffUL, value);
}

/* A record line: 16 hex pairs separated by blanks. */
static int record_line(char* line, unsigned char* record)
{
    char* rest = line;
    char* word;
    unsigned filled = 0;
    while ((word = strtok_r(rest, " ", &rest)) != NULL)
    {
        unsigned long byte = 0;
        if (filled == RECORD_SIZE || !parse_number(word, 16, 0xff, &byte))
        {
            return 0;
        }
        record[filled++] = (unsigned char)byte;
    }
    return filled == RECORD_SIZE;
}

void selb_load(void)
{
    char line[256];
    FILE* in = fopen(selb_state.path, "r");
    unsigned highest = 0;
    if (!in)
    {
        return; /* an empty SEL */
    }
    while (fgets(line, sizeof line, in))
    {
        unsigned long value = 0;
        unsigned char* record = selb_state.records[selb_state.count];
        line[strcspn(line, "\r\n")] = '\0';
        if (setting(line, "next-id", &value))
        {
            selb_state.next_id = (unsigned)value;
        }
        else if (setting(line, "last-add", &value))
        {
            selb_state.last_add = (uint32_t)value;
        }
        else if (setting(line, "last-erase", &value))
        {
            selb_state.last_erase = (uint32_t)value;
        }
        else if (selb_state.count < selb_state.capacity &&
                 record_line(line, record))
        {
            if (selb_record_id(record) > highest)
            {
                highest = selb_record_id(record);
            }
            ++selb_state.count;
        }
    }
    fclose(in);
    if (selb_state.next_id <= highest)
    {
        selb_state.next_id = highest + 1;
    }
}

/* The id a new record gets, making room first where the SEL wraps.
 * Returns 0 when the SEL is full and does not wrap. */
static unsigned selb_make_room(void)
{
    unsigned id;
    if (selb_state.ring)
    {
        id = selb_state.count == 0
                 ? 1
                 : selb_record_id(selb_state.records[selb_state.count - 1]) %
                           selb_state.capacity +
                       1;
        if (selb_state.count == selb_state.capacity)
        {
            memmove(selb_state.records[0], selb_state.records[1],
                    (size_t)(selb_state.count - 1) * RECORD_SIZE);
            --selb_state.count;
        }
        return id;
    }
    if (selb_state.count == selb_state.capacity)
    {
        selb_state.overflow = 1;
        return 0;
    }
    id = selb_state.next_id;
    if (id == 0 || id >= 0xffff)
    {
        id = 1;
    }
    selb_state.next_id = id + 1;
    return id;
}

/* Stores a record as the BMC writes it; gives its id, 0 when full. */
unsigned selb_append(const unsigned char* data)
{
    const unsigned id = selb_make_room();
    unsigned char* record;
    if (id == 0)
    {
        return 0;
    }
    record = selb_state.records[selb_state.count++];
    memcpy(record, data, RECORD_SIZE);
    selb_put16(record, id);
    selb_state.last_add = selb_time();
    if (record[2] < 0xe0)
    {
        selb_put32(record + 3, selb_state.last_add);
    }
    return id;
}

void selb_finish_erase(void)
{
    /* A system event of the Event Logging Disabled sensor (type 10h,
     * sensor 01h): "Log Area Reset/Cleared". */
    static const unsigned char cleared[RECORD_SIZE] = {
        0,    0,    0x02, 0,    0,    0,    0,    0x20,
        0x00, 0x04, 0x10, 0x01, 0x6f, 0x02, 0xff, 0xff};
    selb_state.count = 0;
    selb_state.overflow = 0;
    selb_state.erasing = 0;
    selb_state.last_erase = selb_time();
    if (++selb_state.reservation == 0)
    {
        selb_state.reservation = 1;
    }
    if (selb_state.clear_record)
    {
        selb_append(cleared);
    }
    selb_save();
}

/* Ends a background erase whose time has come. */
void selb_settle(void)
{
    struct timespec now;
    if (!selb_state.erasing)
    {
        return;
    }
    clock_gettime(CLOCK_MONOTONIC, &now);
    if (now.tv_sec > selb_state.erase_done.tv_sec ||
        (now.tv_sec == selb_state.erase_done.tv_sec &&
         now.tv_nsec >= selb_state.erase_done.tv_nsec))
    {
        selb_finish_erase();
    }
}

/* Applies one key=value option; 0 when it is not one of ours. */
static int apply_option(const char* key, const char* value)
{
    unsigned long number = 0;
    if (strcmp(key, "state") == 0)
    {
        snprintf(selb_state.path, sizeof selb_state.path, "%s", value);
        return 1;
    }
    if (strcmp(key, "reserve") == 0)
    {
        if (!parse_number(value, 16, 0xff, &number))
        {
            return 0;
        }
        selb_state.reserve_cc = (unsigned)number;
        return 1;
    }
    if (!parse_number(value, 10, 3600000UL, &number))
    {
        return 0;
    }
    if (strcmp(key, "max") == 0)
    {
        selb_state.capacity = (unsigned)number;
    }
    else if (strcmp(key, "ring") == 0)
    {
        selb_state.ring = number != 0;
    }
    else if (strcmp(key, "frozen") == 0)
    {
        selb_state.frozen = number != 0;
    }
    else if (strcmp(key, "clear-ms") == 0)
    {
        selb_state.clear_ms = (unsigned)number;
    }
    else if (strcmp(key, "delay-ms") == 0)
    {
        selb_state.delay_ms = (unsigned)number;
    }
    else if (strcmp(key, "clear-record") == 0)
    {
        selb_state.clear_record = number != 0;
    }
    else
    {
        return 0;
    }
    return 1;
}

void selb_parse_options(const char* options)
{
    char copy[2048];
    char* rest = copy;
    char* word;
    snprintf(copy, sizeof copy, "%s", options ? options : "");
    while ((word = strtok_r(rest, " \t", &rest)) != NULL)
    {
        char* value = strchr(word, '=');
        if (value)
        {
            *value++ = '\0';
        }
        if (!value || !apply_option(word, value))
        {
            fprintf(stderr, "sel module: option %s ignored\n", word);
        }
    }
    if (selb_state.capacity == 0 || selb_state.capacity > MAX_CAPACITY)
    {
        selb_state.capacity = selb_state.capacity == 0 ? 64 : MAX_CAPACITY;
    }
}
