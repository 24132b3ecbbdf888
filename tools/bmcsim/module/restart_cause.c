/*
 * An ipmi_sim module for the project's BMC bench. It adds what the
 * simulator lacks for watchdog restarts:
 *
 *  - Get System Restart Cause (chassis netfn, command 07h): "unknown" at
 *    start, "watchdog expired" (04h) once the watchdog has reset, powered
 *    down or power-cycled the (simulated) server;
 *  - reset and power capabilities on the system interface channel, so
 *    that Set Watchdog Timer accepts those actions and the timer fires;
 *  - the console command "restart_cause <value> [channel]".
 *
 * Loaded with `loadlib "<path>/libbmcsim_restart.so"` in lan.conf; its
 * symbols resolve from the ipmi_sim executable.
 */
#include <OpenIPMI/ipmi_msgbits.h>
#include <OpenIPMI/lanserv.h>
#include <OpenIPMI/mcserv.h>
#include <OpenIPMI/serv.h>
#include <stdio.h>
#include <stdlib.h>

#define SYSTEM_CHANNEL 15
#define BMC_ADDRESS 0x20
#define CAUSE_UNKNOWN 0x00
#define CAUSE_WATCHDOG 0x04

static unsigned char restart_cause = CAUSE_UNKNOWN;
static unsigned char restart_channel = 0;
static int (*previous_hw_op)(channel_t* chan, unsigned int op);

static void get_restart_cause(lmc_data_t* mc, msg_t* msg, unsigned char* rdata,
                              unsigned int* rdata_len, void* cb_data)
{
    (void)mc;
    (void)msg;
    (void)cb_data;
    rdata[0] = 0; /* completion code: success */
    rdata[1] = restart_cause;
    rdata[2] = restart_channel;
    *rdata_len = 3;
}

/* The simulator asks the system channel to reset or switch power only
 * when the watchdog expires with such an action. */
static int system_hw_op(channel_t* chan, unsigned int op)
{
    switch (op)
    {
        case HW_OP_RESET:
        case HW_OP_POWERON:
        case HW_OP_POWEROFF:
            restart_cause = CAUSE_WATCHDOG;
            restart_channel = 0;
            break;
        case HW_OP_CHECK_POWER:
            return 1; /* the server is on */
        default:
            break;
    }
    if (previous_hw_op)
    {
        previous_hw_op(chan, op);
    }
    return 0;
}

static int console_restart_cause(emu_out_t* out, emu_data_t* emu,
                                 lmc_data_t* mc, char** toks)
{
    const char* err = NULL;
    unsigned int cause = 0;
    unsigned int channel = 0;
    (void)emu;
    (void)mc;
    if (get_uint(toks, &cause, &err))
    {
        out->eprintf(out, "**restart_cause: %s\n", err ? err : "bad value");
        return -1;
    }
    if (get_uint(toks, &channel, &err))
    {
        channel = 0;
    }
    restart_cause = (unsigned char)cause;
    restart_channel = (unsigned char)channel;
    return 0;
}

static void give_system_channel_power(sys_data_t* sys)
{
    lmc_data_t* mc = sys->ipmb_addrs[BMC_ADDRESS];
    channel_t** channels;
    channel_t* system;
    if (!mc || !sys->mc_get_channelset)
    {
        fprintf(stderr, "restart module: no BMC at 0x%x\n", BMC_ADDRESS);
        return;
    }
    channels = sys->mc_get_channelset(mc);
    system = channels ? channels[SYSTEM_CHANNEL] : NULL;
    if (!system)
    {
        fprintf(stderr, "restart module: no system interface channel\n");
        return;
    }
    if (system->hw_op != system_hw_op)
    {
        previous_hw_op = system->hw_op;
        system->hw_op = system_hw_op;
    }
    system->hw_capabilities |= (1 << HW_OP_RESET) | (1 << HW_OP_POWERON);
}

int ipmi_sim_module_print_version(sys_data_t* sys, char* options)
{
    (void)sys;
    (void)options;
    printf("bmcsim restart-cause module 1\n");
    return 0;
}

int ipmi_sim_module_init(sys_data_t* sys, char* options)
{
    int rv;
    (void)sys;
    (void)options;
    rv = ipmi_emu_register_cmd_handler(IPMI_CHASSIS_NETFN,
                                       IPMI_GET_SYSTEM_RESTART_CAUSE_CMD,
                                       get_restart_cause, NULL);
    if (rv)
    {
        fprintf(stderr, "restart module: cannot register the command: %d\n",
                rv);
        return rv;
    }
    return ipmi_emu_add_cmd("restart_cause", NOMC, console_restart_cause);
}

int ipmi_sim_module_post_init(sys_data_t* sys)
{
    give_system_channel_power(sys);
    return 0;
}
