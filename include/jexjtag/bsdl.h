/* SPDX-License-Identifier: MIT */
/*
 * bsdl.h - boundary scan from BSDL files: a device's full description, a
 * library of BSDL files indexed by IDCODE, and pin access (SAMPLE, EXTEST,
 * HIGHZ, CLAMP).
 *
 * A BSDL file is opened into a session as a "part" (a small number that
 * stays valid until JexJtag_bsdl_close or the session's end).  Parts are
 * read in full: instructions with all their opcodes, INSTRUCTION_CAPTURE,
 * every BOUNDARY_REGISTER cell, the ports with their package pins, and
 * REGISTER_ACCESS.  A malformed file is refused; the reason, naming the file
 * and the line, goes to the host as a JEX_MSG_ERROR message.
 *
 * Pin access works on one device of the open target's chain with every
 * other device in BYPASS (the plug-in pads device shifts for them, whatever
 * their IR lengths).  It first sets the device's IR length to the part's.
 * A device that JexJtag_bsdl_extest, _highz or _clamp left in that mode is
 * held there: later pin access on other devices loads its instruction again
 * (and, under EXTEST, its boundary register with the same values), so a pin
 * one part drives can be sampled on another.  JexJtag_bsdl_sample on the
 * held device itself releases it.  Holding needs the IR lengths of every
 * device of the chain.  Boundary-register bits go in the ABI's order: cell
 * 0 (nearest TDO) first.
 *
 * Every function returns JEX_SUCCESS or JEX_FAILURE; an unknown session
 * handle or part, or a null pointer where one is required, fails.
 * Text buffers get their text NUL-terminated, cut to capacity - 1.
 */
#ifndef JEXJTAG_BSDL_H
#define JEXJTAG_BSDL_H

#include "types.h"

JEXJTAG_BEGIN_DECLS

/* Sizes of the texts in the records below, NUL included. */
#define JEXJTAG_BSDL_NAME_SIZE 128
#define JEXJTAG_BSDL_SHORT_SIZE 32

/* IEEE 1149.1 boundary-cell functions. */
typedef enum JexBsdlFunction {
    JEXJTAG_BSDL_INPUT        = 0,
    JEXJTAG_BSDL_CLOCK        = 1,
    JEXJTAG_BSDL_OUTPUT2      = 2,
    JEXJTAG_BSDL_OUTPUT3      = 3,
    JEXJTAG_BSDL_CONTROL      = 4,
    JEXJTAG_BSDL_CONTROLR     = 5,
    JEXJTAG_BSDL_INTERNAL     = 6,
    JEXJTAG_BSDL_BIDIR        = 7,
    JEXJTAG_BSDL_OBSERVE_ONLY = 8
} JexBsdlFunction;

/* What a part declares, in one record. */
typedef struct JexBsdlSummary {
    char     entity[JEXJTAG_BSDL_NAME_SIZE]; /* entity (component) name */
    char     idcode[36];        /* IDCODE_REGISTER, 32 of 0/1/X/x; "" when none */
    uint32_t irLength;          /* INSTRUCTION_LENGTH */
    uint32_t boundaryLength;    /* BOUNDARY_LENGTH; 0 without a boundary register */
    uint32_t instructionCount;  /* entries of INSTRUCTION_OPCODE */
    uint32_t pinCount;          /* pins with a boundary cell (see JexJtag_bsdl_getPin) */
    uint32_t registerAccessCount; /* entries of REGISTER_ACCESS */
} JexBsdlSummary;

JEXJTAG_STATIC_ASSERT(sizeof(JexBsdlSummary) == 184, "JexBsdlSummary is 184 bytes");
JEXJTAG_STATIC_ASSERT(offsetof(JexBsdlSummary, irLength) == 164, "JexBsdlSummary.irLength");

/* One boundary-register cell:
 * "num (cellType, port, function, safe [, controlCell, disableValue, disableResult])". */
typedef struct JexBsdlCell {
    uint32_t number;
    uint32_t function;        /* JexBsdlFunction */
    int32_t  controlCell;     /* -1 without disable fields */
    char     safe;            /* '0', '1' or 'X' */
    char     disableValue;    /* '0' or '1'; 0 without a control cell */
    char     reserved[2];
    char     cellType[JEXJTAG_BSDL_SHORT_SIZE];  /* "BC_1" */
    char     port[JEXJTAG_BSDL_NAME_SIZE];       /* "IO(0)", "CLK" or "*" */
    char     disableResult[JEXJTAG_BSDL_SHORT_SIZE]; /* "Z", "WEAK1", ...; "" */
    char     mergedInput[JEXJTAG_BSDL_NAME_SIZE]; /* port of a merged input entry; "" */
} JexBsdlCell;

JEXJTAG_STATIC_ASSERT(sizeof(JexBsdlCell) == 336, "JexBsdlCell is 336 bytes");
JEXJTAG_STATIC_ASSERT(offsetof(JexBsdlCell, cellType) == 16, "JexBsdlCell.cellType");

/* One pin: a port element ("IO(0)") that has a boundary cell, with its
 * package pin and the cells that serve it. */
typedef struct JexBsdlPin {
    char     port[JEXJTAG_BSDL_NAME_SIZE]; /* "IO(0)" or "CLK" */
    char     pin[JEXJTAG_BSDL_SHORT_SIZE]; /* package pin ("9", "A4"); "" when unmapped */
    uint32_t function;    /* JexBsdlFunction: BIDIR for a pin with a driving and a capturing cell,
                             else the function of its one cell */
    int32_t  cell;        /* the driving cell, else the capturing cell */
    int32_t  inputCell;   /* cell that captures the pin; -1 none */
    int32_t  outputCell;  /* cell that drives the pin; -1 none */
    int32_t  controlCell; /* cell that enables outputCell; -1 none */
    uint32_t reserved;
} JexBsdlPin;

JEXJTAG_STATIC_ASSERT(sizeof(JexBsdlPin) == 184, "JexBsdlPin is 184 bytes");

/* The BSDL name of a function ("observe_only"); "" for other values.  The
 * text is static. */
JEXJTAG_API const char* JexJtag_bsdl_functionName(uint32_t function);

/* Reads the BSDL file at path into the session; *part receives its number.
 * A file that cannot be read or is not sound BSDL fails (message to the
 * host); *part is then 0, which no part has. */
JEXJTAG_API uint32_t JexJtag_bsdl_open(unsigned handle, const char* path, unsigned* part);
/* The same for a BSDL text of bufLen bytes in memory; name labels messages. */
JEXJTAG_API uint32_t JexJtag_bsdl_openBuffer(unsigned handle, const char* name, const char* buf, unsigned bufLen,
                                             unsigned* part);
/* Releases a part. */
JEXJTAG_API uint32_t JexJtag_bsdl_close(unsigned handle, unsigned part);

/* Fills *summary. */
JEXJTAG_API uint32_t JexJtag_bsdl_getSummary(unsigned handle, unsigned part, JexBsdlSummary* summary);
/* Instruction `index` (0 .. instructionCount - 1, in declaration order):
 * its name into name, and all its opcodes, comma-separated in declaration
 * order ("11111,01111"), into opcodes.  Either buffer may be null. */
JEXJTAG_API uint32_t JexJtag_bsdl_getInstruction(unsigned handle, unsigned part, unsigned index, char* name,
                                                 unsigned nameLen, char* opcodes, unsigned opcodesLen);
/* INSTRUCTION_CAPTURE as written ("0101", "XXXXXX01"); "" when not given. */
JEXJTAG_API uint32_t JexJtag_bsdl_getInstructionCapture(unsigned handle, unsigned part, char* capture,
                                                        unsigned captureLen);
/* Boundary cell `number` (0 .. boundaryLength - 1). */
JEXJTAG_API uint32_t JexJtag_bsdl_getCell(unsigned handle, unsigned part, unsigned number, JexBsdlCell* cell);
/* Pin `index` (0 .. pinCount - 1), in the order the port clause declares them. */
JEXJTAG_API uint32_t JexJtag_bsdl_getPin(unsigned handle, unsigned part, unsigned index, JexBsdlPin* pin);
/* REGISTER_ACCESS entry `index`: the register's name, its length from
 * "[n]" (0 when not given; length may be null) and its instructions,
 * comma-separated. */
JEXJTAG_API uint32_t JexJtag_bsdl_getRegisterAccess(unsigned handle, unsigned part, unsigned index,
                                                    char* registerName, unsigned registerNameLen, unsigned* length,
                                                    char* instructions, unsigned instructionsLen);

/* ---- BSDL library: files indexed by IDCODE_REGISTER ---------------------- */

/* Adds every file in directory (not its subdirectories) whose name ends in
 * .bsd, .bsdl or .bsm (any case) to the session's BSDL library, indexed by
 * its IDCODE_REGISTER with X bits as don't-care.  Files that are not sound
 * BSDL or declare no IDCODE are skipped (a JEX_MSG_WARNING names each bad
 * one).  *added (may be null) receives the number of files indexed.  A
 * directory that cannot be read fails. */
JEXJTAG_API uint32_t JexJtag_bsdl_addDirectory(unsigned handle, const char* directory, unsigned* added);
/* Looks an IDCODE ('0'/'1' text, most significant bit first) up in the
 * session's BSDL library: of the files whose pattern matches, the one that
 * fixes the most bits (the first added among equals), so a file with an
 * all-don't-care IDCODE names only what no other file matches.  A
 * code nothing matches succeeds with empty texts and *irLength 0.  Any
 * output may be null. */
JEXJTAG_API uint32_t JexJtag_bsdl_findByIdcode(unsigned handle, const char* idcode, char* entity,
                                               unsigned entityLen, unsigned* irLength, char* path,
                                               unsigned pathLen);

/* ---- Pin access on device deviceIndex of the open target ----------------- */

/* SAMPLE: loads the part's SAMPLE instruction, shifts the boundary register
 * (refilling it with the cells' safe values) and writes each pin's captured
 * level into levels[i] for pin i: 0, 1, or -1 for a pin without a capturing
 * cell.  levelCount must be at least the part's pinCount.  cells (may be
 * null; cellsLen bytes, at least (boundaryLength + 7) / 8) receives the
 * captured register. */
JEXJTAG_API uint32_t JexJtag_bsdl_sample(unsigned handle, unsigned deviceIndex, unsigned part,
                                         signed char* levels, unsigned levelCount, unsigned char* cells,
                                         unsigned cellsLen);
/* EXTEST: drives count pins, pins[i] (a port element such as "IO(0)", or a
 * package pin) to values[i] ('0', '1', or 'z'/'Z' for released).  Every
 * other cell holds its safe value (X as 0); the control cell of each named
 * pin is set to enable it (0/1) or disable it (z).  The register is first
 * preloaded (PRELOAD, else SAMPLE), then EXTEST is loaded and the register
 * shifted once more, so the pins' levels under EXTEST land in levels (may be
 * null; as for JexJtag_bsdl_sample).  A pin without a driving cell, or one
 * that cannot be released, fails before anything is shifted; so does a pin
 * named twice.  The device stays in EXTEST. */
JEXJTAG_API uint32_t JexJtag_bsdl_extest(unsigned handle, unsigned deviceIndex, unsigned part, unsigned count,
                                         const char* const* pins, const char* values, signed char* levels,
                                         unsigned levelCount);
/* HIGHZ: loads the part's HIGHZ instruction (every output released). */
JEXJTAG_API uint32_t JexJtag_bsdl_highz(unsigned handle, unsigned deviceIndex, unsigned part);
/* CLAMP: preloads the cells' safe values, then loads CLAMP (outputs held
 * at them, BYPASS selected). */
JEXJTAG_API uint32_t JexJtag_bsdl_clamp(unsigned handle, unsigned deviceIndex, unsigned part);

JEXJTAG_END_DECLS

#endif /* JEXJTAG_BSDL_H */
