/*
 * The SEL kept by the SEL behaviour module (sel_behaviour.c): its state,
 * the file it is kept in, and how records come and go. Every name here is
 * hidden in the module, so none can collide with the simulator's own.
 */
#ifndef BMCSIM_SEL_STORE_H
#define BMCSIM_SEL_STORE_H

#include <stdint.h>
#include <time.h>

#pragma GCC visibility push(hidden)

#define MAX_CAPACITY 8192
#define RECORD_SIZE 16
#define STORAGE_NETFN 0x0a

#define CC_OK 0x00
#define CC_ERASE_IN_PROGRESS 0x81
#define CC_INVALID_COMMAND 0xc1
#define CC_OUT_OF_SPACE 0xc4
#define CC_RESERVATION_CANCELLED 0xc5
#define CC_REQUEST_LENGTH 0xc7
#define CC_OUT_OF_RANGE 0xc9
#define CC_NOT_PRESENT 0xcb
#define CC_INVALID_FIELD 0xcc

struct sel_state
{
    unsigned char records[MAX_CAPACITY][RECORD_SIZE]; /* oldest first */
    unsigned count;
    unsigned capacity;
    int ring;
    int frozen;
    unsigned clear_ms;
    unsigned delay_ms; /* every SEL command answered this much later */
    int clear_record;
    unsigned reserve_cc;
    unsigned next_id; /* without ring: the next id given out */
    unsigned reservation;
    uint32_t last_add;
    uint32_t last_erase;
    uint32_t started;
    int overflow;
    int erasing;
    struct timespec erase_done;
    long clock_offset;
    char path[1024];
};

extern struct sel_state selb_state;

unsigned selb_record_id(const unsigned char* record);
/** The BMC's SEL clock: the host's clock plus what Set SEL Time moved. */
uint32_t selb_time(void);
void selb_put16(unsigned char* out, unsigned value);
void selb_put32(unsigned char* out, uint32_t value);
/** Rewrites the SEL file (aside, then renamed). */
void selb_save(void);
/** Reads the SEL file, if there is one. */
void selb_load(void);
/** Stores a record as the BMC writes it; gives its id, 0 when full. */
unsigned selb_append(const unsigned char* data);
/** Empties the SEL now, as a completed erase does. */
void selb_finish_erase(void);
/** Ends a background erase whose time has come. */
void selb_settle(void);
/** Reads the module's options (see sel_behaviour.c). */
void selb_parse_options(const char* options);

#pragma GCC visibility pop

#endif
