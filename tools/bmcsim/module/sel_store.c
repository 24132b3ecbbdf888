/*
 * The SEL of the SEL behaviour module: records oldest first, the ring or
 * refusing fill, the background erase, and the file it is kept in.
 */
#include "sel_store.h"

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
        unsigned value = 0;
        unsigned bytes[RECORD_SIZE];
        unsigned i;
        if (sscanf(line, "next-id %u", &value) == 1)
        {
            selb_state.next_id = value;
        }
        else if (sscanf(line, "last-add %u", &value) == 1)
        {
            selb_state.last_add = value;
        }
        else if (sscanf(line, "last-erase %u", &value) == 1)
        {
            selb_state.last_erase = value;
        }
        else if (selb_state.count < selb_state.capacity &&
                 sscanf(line, "%x %x %x %x %x %x %x %x %x %x %x %x %x %x %x %x",
                        &bytes[0], &bytes[1], &bytes[2], &bytes[3], &bytes[4],
                        &bytes[5], &bytes[6], &bytes[7], &bytes[8], &bytes[9],
                        &bytes[10], &bytes[11], &bytes[12], &bytes[13],
                        &bytes[14], &bytes[15]) == RECORD_SIZE)
        {
            for (i = 0; i < RECORD_SIZE; ++i)
            {
                selb_state.records[selb_state.count][i] =
                    (unsigned char)bytes[i];
            }
            if (selb_record_id(selb_state.records[selb_state.count]) > highest)
            {
                highest = selb_record_id(selb_state.records[selb_state.count]);
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

void selb_parse_options(const char* options)
{
    char copy[2048];
    char* rest = copy;
    char* word;
    snprintf(copy, sizeof copy, "%s", options ? options : "");
    while ((word = strtok_r(rest, " \t", &rest)) != NULL)
    {
        char* value = strchr(word, '=');
        if (!value)
        {
            continue;
        }
        *value++ = '\0';
        if (strcmp(word, "state") == 0)
        {
            snprintf(selb_state.path, sizeof selb_state.path, "%s", value);
        }
        else if (strcmp(word, "max") == 0)
        {
            selb_state.capacity = (unsigned)strtoul(value, NULL, 0);
        }
        else if (strcmp(word, "ring") == 0)
        {
            selb_state.ring = atoi(value) != 0;
        }
        else if (strcmp(word, "frozen") == 0)
        {
            selb_state.frozen = atoi(value) != 0;
        }
        else if (strcmp(word, "clear-ms") == 0)
        {
            selb_state.clear_ms = (unsigned)strtoul(value, NULL, 0);
        }
        else if (strcmp(word, "clear-record") == 0)
        {
            selb_state.clear_record = atoi(value) != 0;
        }
        else if (strcmp(word, "reserve") == 0)
        {
            selb_state.reserve_cc = (unsigned)strtoul(value, NULL, 16) & 0xff;
        }
        else
        {
            fprintf(stderr, "sel module: unknown option %s\n", word);
        }
    }
    if (selb_state.capacity == 0 || selb_state.capacity > MAX_CAPACITY)
    {
        selb_state.capacity = selb_state.capacity == 0 ? 64 : MAX_CAPACITY;
    }
}
