/* SPDX-License-Identifier: MIT */
#ifndef JEXJTAG_FTDI_EMU_CONTROL_H
#define JEXJTAG_FTDI_EMU_CONTROL_H
/*
 * The emulated FTDI adapters behind the stand-in libusb-1.0 (tests only).
 *
 * A process that loads the stand-in sees the adapters that the environment
 * describes when libusb is first initialised:
 *   JEXJTAG_FTDI_EMU_ADAPTERS  "VID:PID:CHIP:PRODUCT:SERIAL[;...]", CHIP one of
 *                              2232D 2232H 4232H 232H (default one FT2232H,
 *                              "0403:6010:2232H:Dual RS232-HS:JEX0001")
 *   JEXJTAG_FTDI_EMU_CHAIN     the chain on every adapter, in jtag_sim's chain
 *                              syntax (default: jtag_sim's three devices)
 *   JEXJTAG_FTDI_EMU_REJECT    opcodes the chips answer with "bad command"
 *                              (comma-separated hex, e.g. "0x96")
 *   JEXJTAG_FTDI_EMU_DENY      "1": opening a device fails with LIBUSB_ERROR_ACCESS
 *   JEXJTAG_FTDI_EMU_CONTROL   a file read before every transfer: "unplug"
 *                              unplugs every adapter now, "unplug-after N" after
 *                              N more bulk OUT transfers
 * A later libusb_init() with no device open rebuilds the adapters when these
 * variables changed.  Adapter i sits on bus 1, port path 2.(i+1), address i+2.
 */

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* USB traffic of all emulated adapters since the last reset. */
struct FtdiEmuCounters {
    uint64_t bulkOut;   /* bulk OUT transfers */
    uint64_t bulkIn;    /* bulk IN transfers */
    uint64_t bytesOut;  /* bytes written */
    uint64_t bytesIn;   /* bytes returned, modem-status bytes included */
};

/* The MPSSE state of one channel of one adapter. */
struct FtdiEmuChannel {
    uint32_t tckHz;      /* TCK from the divisor and divide-by-5 */
    uint16_t divisor;
    uint16_t pins;       /* xCBUS in bits 8-15, xDBUS in bits 0-7 */
    uint16_t directions; /* 1 = output */
    uint8_t divideBy5;
    uint8_t adaptive;
    uint8_t threePhase;
    uint8_t mpsse;
    uint64_t badCommands;
};

void jexjtag_ftdi_emu_counters(struct FtdiEmuCounters* counters);
void jexjtag_ftdi_emu_reset_counters(void);
/* 0 on success, -1 for an adapter or channel that does not exist. */
int jexjtag_ftdi_emu_channel(unsigned adapter, unsigned channel, struct FtdiEmuChannel* state);

#ifdef __cplusplus
}
#endif

#endif
