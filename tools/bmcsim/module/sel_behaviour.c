/*
 * An ipmi_sim module that takes over the simulator's SEL commands and
 * keeps a SEL that behaves as some real BMCs do. The options string
 * (space-separated key=value words) picks the behaviours; they combine:
 *
 *   state=PATH     the SEL file: read at start, rewritten after every
 *                  change (one record per line as 16 hex pairs, plus the
 *                  id counter and the two times). Required.
 *   max=N          capacity in records (default 64, at most 8192).
 *   ring=1         a full SEL overwrites its oldest record: the count
 *                  stays at max and record ids go round 1..max, reused.
 *                  Without it a full SEL refuses new records (C4h).
 *   frozen=1       Get SEL Info reports the module's start time as the
 *                  last addition and last erase, whatever happens.
 *   clear-ms=N     Clear SEL erases in the background for N ms: meanwhile
 *                  the erasure status says "in progress", Get SEL Entry,
 *                  Reserve SEL and Add SEL Entry answer 81h. The end of
 *                  the erase cancels the reservation.
 *   clear-record=1 a cleared SEL starts with a "Log Area Reset/Cleared"
 *                  record (Event Logging Disabled sensor, offset 02h).
 *   reserve=CC     Reserve SEL answers completion code CC (C1h: command
 *                  not supported, D4h: insufficient privilege); every
 *                  reservation id is then accepted.
 *   delay-ms=N     every SEL command is answered N ms late, as over a
 *                  LAN to a real BMC (default 0). The simulator's event
 *                  loop waits meanwhile, as a BMC's one handler would.
 *
 * Records are added with Add SEL Entry (ipmitool "sel add", FreeIPMI raw)
 * or with the console command "sel_behaviour_add <16 bytes>"; for record
 * types below E0h the BMC writes the id and its own SEL time into them.
 *
 * Loaded with `loadlib "<path>/libbmcsim_sel.so" "<options>"` in lan.conf;
 * its symbols resolve from the ipmi_sim executable. ipmi_sim runs every
 * handler on its one event loop thread, so the state needs no lock. The
 * SEL itself is kept by sel_store.c.
 */
#include "sel_store.h"

#include <OpenIPMI/ipmi_msgbits.h>
#include <OpenIPMI/lanserv.h>
#include <OpenIPMI/mcserv.h>
#include <OpenIPMI/serv.h>
#include <errno.h>
#include <stdio.h>
#include <string.h>
#include <time.h>

static int reservation_valid(unsigned reservation)
{
    return selb_state.reserve_cc != 0 || reservation == selb_state.reservation;
}

static void answer(unsigned char* rdata, unsigned int* rdata_len,
                   unsigned char code)
{
    rdata[0] = code;
    *rdata_len = 1;
}

/* Brings the SEL up to date for a request that needs @p min_len data
 * bytes; answers C7h and returns 0 when it has fewer, and answers 81h and
 * returns 0 during an erase when @p refused_while_erasing. */
static int request_fits(const msg_t* msg, unsigned min_len,
                        int refused_while_erasing, unsigned char* rdata,
                        unsigned int* rdata_len)
{
    selb_settle();
    if (msg->len < min_len)
    {
        answer(rdata, rdata_len, CC_REQUEST_LENGTH);
        return 0;
    }
    if (refused_while_erasing && selb_state.erasing)
    {
        answer(rdata, rdata_len, CC_ERASE_IN_PROGRESS);
        return 0;
    }
    return 1;
}

static void get_sel_info(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                         unsigned int* rdata_len, void* cb_data)
{
    const unsigned free_bytes =
        (selb_state.capacity - selb_state.count) * RECORD_SIZE;
    (void)mc;
    (void)msg;
    (void)cb_data;
    selb_settle();
    rdata[0] = CC_OK;
    rdata[1] = 0x51;
    selb_put16(rdata + 2, selb_state.count);
    selb_put16(rdata + 4, free_bytes > 0xfffe ? 0xfffe : free_bytes);
    selb_put32(rdata + 6,
               selb_state.frozen ? selb_state.started : selb_state.last_add);
    selb_put32(rdata + 10,
               selb_state.frozen ? selb_state.started : selb_state.last_erase);
    rdata[14] =
        (unsigned char)((selb_state.overflow ? 0x80 : 0) |
                        (selb_state.reserve_cc == CC_INVALID_COMMAND ? 0
                                                                     : 0x02));
    *rdata_len = 15;
}

static void reserve_sel(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                        unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)msg;
    (void)cb_data;
    selb_settle();
    if (selb_state.reserve_cc != 0)
    {
        answer(rdata, rdata_len, (unsigned char)selb_state.reserve_cc);
        return;
    }
    if (selb_state.erasing)
    {
        answer(rdata, rdata_len, CC_ERASE_IN_PROGRESS);
        return;
    }
    if (++selb_state.reservation > 0xffff)
    {
        selb_state.reservation = 1;
    }
    rdata[0] = CC_OK;
    selb_put16(rdata + 1, selb_state.reservation);
    *rdata_len = 3;
}

/* The walk index of @p id (0000h: first, FFFFh: last), or -1. */
static int find(unsigned id)
{
    unsigned i;
    if (selb_state.count == 0)
    {
        return -1;
    }
    if (id == 0)
    {
        return 0;
    }
    if (id == 0xffff)
    {
        return (int)selb_state.count - 1;
    }
    for (i = 0; i < selb_state.count; ++i)
    {
        if (selb_record_id(selb_state.records[i]) == id)
        {
            return (int)i;
        }
    }
    return -1;
}

static void get_sel_entry(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                          unsigned int* rdata_len, void* cb_data)
{
    unsigned offset;
    unsigned length;
    int index;
    (void)mc;
    (void)cb_data;
    if (!request_fits(msg, 6, 1, rdata, rdata_len))
    {
        return;
    }
    if (ipmi_get_uint16(msg->data) != 0 &&
        !reservation_valid(ipmi_get_uint16(msg->data)))
    {
        answer(rdata, rdata_len, CC_RESERVATION_CANCELLED);
        return;
    }
    index = find(ipmi_get_uint16(msg->data + 2));
    if (index < 0)
    {
        answer(rdata, rdata_len, CC_NOT_PRESENT);
        return;
    }
    offset = msg->data[4];
    length = msg->data[5] == 0xff ? RECORD_SIZE : msg->data[5];
    if (offset > RECORD_SIZE)
    {
        answer(rdata, rdata_len, CC_OUT_OF_RANGE);
        return;
    }
    if (length > RECORD_SIZE - offset)
    {
        length = RECORD_SIZE - offset;
    }
    rdata[0] = CC_OK;
    selb_put16(rdata + 1, (unsigned)index + 1 < selb_state.count
                              ? selb_record_id(selb_state.records[index + 1])
                              : 0xffff);
    memcpy(rdata + 3, selb_state.records[index] + offset, length);
    *rdata_len = 3 + length;
}

static void add_sel_entry(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                          unsigned int* rdata_len, void* cb_data)
{
    unsigned id;
    (void)mc;
    (void)cb_data;
    if (!request_fits(msg, RECORD_SIZE, 1, rdata, rdata_len))
    {
        return;
    }
    id = selb_append(msg->data);
    if (id == 0)
    {
        answer(rdata, rdata_len, CC_OUT_OF_SPACE);
        return;
    }
    selb_save();
    rdata[0] = CC_OK;
    selb_put16(rdata + 1, id);
    *rdata_len = 3;
}

static void clear_sel(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                      unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)cb_data;
    if (!request_fits(msg, 6, 0, rdata, rdata_len))
    {
        return;
    }
    if (msg->data[2] != 'C' || msg->data[3] != 'L' || msg->data[4] != 'R' ||
        (msg->data[5] != 0xaa && msg->data[5] != 0x00))
    {
        answer(rdata, rdata_len, CC_INVALID_FIELD);
        return;
    }
    if (!reservation_valid(ipmi_get_uint16(msg->data)))
    {
        answer(rdata, rdata_len, CC_RESERVATION_CANCELLED);
        return;
    }
    if (msg->data[5] == 0xaa && !selb_state.erasing)
    {
        if (selb_state.clear_ms == 0)
        {
            selb_finish_erase();
        }
        else
        {
            clock_gettime(CLOCK_MONOTONIC, &selb_state.erase_done);
            selb_state.erase_done.tv_sec += selb_state.clear_ms / 1000;
            selb_state.erase_done.tv_nsec +=
                (long)(selb_state.clear_ms % 1000) * 1000000L;
            if (selb_state.erase_done.tv_nsec >= 1000000000L)
            {
                selb_state.erase_done.tv_sec += 1;
                selb_state.erase_done.tv_nsec -= 1000000000L;
            }
            selb_state.erasing = 1;
        }
    }
    rdata[0] = CC_OK;
    rdata[1] = selb_state.erasing ? 0x00 : 0x01; /* in progress / completed */
    *rdata_len = 2;
}

static void get_sel_time(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                         unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)msg;
    (void)cb_data;
    rdata[0] = CC_OK;
    selb_put32(rdata + 1, selb_time());
    *rdata_len = 5;
}

static void set_sel_time(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                         unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)cb_data;
    if (msg->len < 4)
    {
        answer(rdata, rdata_len, CC_REQUEST_LENGTH);
        return;
    }
    selb_state.clock_offset =
        (long)ipmi_get_uint32(msg->data) - (long)time(NULL);
    answer(rdata, rdata_len, CC_OK);
}

/* Allocation info, partial add and delete are not offered. */
static void not_supported(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                          unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)msg;
    (void)cb_data;
    answer(rdata, rdata_len, CC_INVALID_COMMAND);
}

static int console_add(emu_out_t* out, emu_data_t* emu, lmc_data_t* mc,
                       char** toks)
{
    unsigned char record[RECORD_SIZE];
    unsigned i;
    (void)emu;
    (void)mc;
    for (i = 0; i < RECORD_SIZE; ++i)
    {
        const char* err = NULL;
        unsigned value = 0;
        if (get_uint(toks, &value, &err) || value > 0xff)
        {
            out->eprintf(out, "**sel_behaviour_add: 16 bytes expected\n");
            return -1;
        }
        record[i] = (unsigned char)value;
    }
    selb_settle();
    if (selb_state.erasing || selb_append(record) == 0)
    {
        out->eprintf(out, "**sel_behaviour_add: the SEL refused it\n");
        return -1;
    }
    selb_save();
    return 0;
}

int ipmi_sim_module_print_version(sys_data_t* sys, char* options)
{
    (void)sys;
    (void)options;
    printf("bmcsim SEL behaviour module 1\n");
    return 0;
}

struct sel_command
{
    unsigned char cmd;
    cmd_handler_f handler;
};

static struct sel_command sel_commands[] = {
    {0x40, get_sel_info},  {0x41, not_supported}, {0x42, reserve_sel},
    {0x43, get_sel_entry}, {0x44, add_sel_entry}, {0x45, not_supported},
    {0x46, not_supported}, {0x47, clear_sel},     {0x48, get_sel_time},
    {0x49, set_sel_time},
};

/* Every SEL command comes here: the delay, then its handler. */
static void delayed(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                    unsigned int* rdata_len, void* cb_data)
{
    const struct sel_command* command = cb_data;
    if (selb_state.delay_ms != 0)
    {
        struct timespec pause;
        pause.tv_sec = selb_state.delay_ms / 1000;
        pause.tv_nsec = (long)(selb_state.delay_ms % 1000) * 1000000L;
        while (nanosleep(&pause, &pause) != 0 && errno == EINTR)
        {
        }
    }
    command->handler(mc, msg, rdata, rdata_len, NULL);
}

int ipmi_sim_module_init(sys_data_t* sys, char* options)
{
    unsigned i;
    (void)sys;
    memset(&selb_state, 0, sizeof selb_state);
    selb_parse_options(options);
    if (selb_state.path[0] == '\0')
    {
        fprintf(stderr, "sel module: the state=PATH option is required\n");
        return -1;
    }
    selb_state.started = (uint32_t)time(NULL);
    selb_state.next_id = 1;
    selb_state.reservation = 1;
    selb_load();
    for (i = 0; i < sizeof sel_commands / sizeof sel_commands[0]; ++i)
    {
        const int rv = ipmi_emu_register_cmd_handler(
            STORAGE_NETFN, sel_commands[i].cmd, delayed, &sel_commands[i]);
        if (rv)
        {
            fprintf(stderr, "sel module: cannot register 0x%02x: %d\n",
                    sel_commands[i].cmd, rv);
            return rv;
        }
    }
    return ipmi_emu_add_cmd("sel_behaviour_add", NOMC, console_add);
}
