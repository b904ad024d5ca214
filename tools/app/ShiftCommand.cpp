// SPDX-License-Identifier: MIT
// The "shift" command.

#include <cctype>

#include "ChainReader.hpp"
#include "CliError.hpp"
#include "DataText.hpp"
#include "Idcode.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "ShiftOutput.hpp"
#include "TapStateName.hpp"
#include "TargetConnection.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kShiftHead = R"HELP(Usage: jexjtag shift ir|dr [DATA] [OPTIONS]

Opens the target, takes the cable lock and shifts DATA through the
instruction register (ir) or the data register path (dr), then prints
what came out of TDO in the notation DATA was written in.

  With --device N the shift addresses device N alone (device 0 is nearest
  TDO; the other devices are put in BYPASS): the chain is detected first.
  An ir shift of one device takes that device's IR length: hexadecimal
  DATA without --bits is fitted to it (0x09 becomes 6 bits for a 6-bit IR).
  Without --device the whole chain is shifted.

DATA is a number written most significant bit first; its LAST digit (the
least significant bit) is shifted FIRST:
  0x1F       hexadecimal: 4 bits per digit written, leading zeros count
             (0x01F is 12 bits)
  0b10110    binary: one bit per digit
  10110      binary without prefix
'_' may separate digits (0x4BA0_0477).  TDO is printed the same way: its
last digit is the first bit that came out.

Options:
  -d, --device N     shift device N's register instead of the whole chain
  -n, --bits N       the length in bits: DATA is widened with zeros or
                     narrowed by dropping leading zeros (a 1 may not be
                     dropped); without DATA, N bits are only read (TDI 0)
      --exit STATE   TAP state to end in (default: RUN_TEST_IDLE)
      --ir INSTR     dr only: first shift INSTR into the instruction
                     register (device N's with --device; same notation and
                     fitting as an ir shift), ending in RUN_TEST_IDLE.
                     Each run opens the target anew, so an instruction a dr
                     shift depends on is loaded in the same run this way.
      --no-autodetect  with --device: keep the IR lengths the plug-in found
      --json         {"register", "device", "bits", "exit_state", "tdi",
                     "tdo", "tdo_bits", "instruction": {"bits", "tdi", "tdo"}}
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS:
                     see jexjtag --help

STATE is one of )HELP";

const char* const kShiftTail = R"HELP(,
with or without the prefix JEXJTAG_, in any case, '-' for '_'
(pause-dr), or its number 0..15.

Examples:
  jexjtag shift ir --device 1 0x09        IDCODE instruction into device 1
  jexjtag shift dr --device 1 --ir 0x09 --bits 32
                                          read device 1's IDCODE register
  jexjtag shift dr 0b1011 --exit pause-dr
  jexjtag shift dr --bits 96 --json       the whole chain's data registers
)HELP";

// What the command line asks of one shift.
struct ShiftRequest {
    bool ir = false;
    std::optional<std::string> data; // DATA; none: read only
    std::optional<unsigned> device;
    std::optional<unsigned> bits;
    std::optional<std::string> irData; // --ir: instruction shifted before a dr shift
    unsigned exitState = JEXJTAG_RUN_TEST_IDLE;
    bool noAutodetect = false;
};

// Throws UsageError for values and operands that do not make a shift.
ShiftRequest readRequest(const Options& options)
{
    ShiftRequest request;
    request.device = options.number("device");
    request.bits = options.number("bits");
    if (const auto state = options.value("exit")) request.exitState = parseTapState(*state);
    request.irData = options.value("ir");
    request.noAutodetect = options.flag("no-autodetect");

    std::string reg = options.operands.at(0);
    for (char& c : reg) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    if (reg != "ir" && reg != "dr")
        throw UsageError("'shift' needs ir or dr first, not '" + options.operands[0] + "'");
    request.ir = reg == "ir";
    if (request.bits && (*request.bits == 0 || *request.bits > kMaxDataBits))
        throw UsageError("--bits needs a length from 1 to " + std::to_string(kMaxDataBits));
    if (options.operands.size() == 1 && !request.bits)
        throw UsageError("'shift' needs data to shift, or --bits N to read only");
    if (request.irData && request.ir) throw UsageError("--ir goes with 'shift dr' only");
    if (options.operands.size() == 2) request.data = options.operands[1];
    return request;
}

std::string registerText(bool ir, const std::optional<unsigned>& device)
{
    const std::string reg = ir ? "instruction register" : "data register";
    return device ? "the " + reg + " of device " + std::to_string(*device) : "the chain's " + reg;
}

// A device's IR shift takes the device's IR length: hexadecimal data whose
// length was not given with --bits is fitted to it; any other length that
// differs is refused.
void fitToInstructionRegister(DataValue& data, const std::string& text, bool lengthGiven, unsigned handle,
                              unsigned device)
{
    unsigned irLength = 0;
    if (JEX_FAILED(JexJtag_tap_getIRLength(handle, device, &irLength)))
        throw CliError("cannot read the IR length of device " + std::to_string(device));
    if (irLength == 0 || data.bits.size() == irLength) return;
    if (!lengthGiven && data.notation == DataNotation::Hex) {
        try {
            data = parseData(text, irLength);
            return;
        } catch (const UsageError&) {
            throw CliError("data " + text + " does not fit into the " + std::to_string(irLength) +
                           "-bit instruction register of device " + std::to_string(device));
        }
    }
    throw CliError("device " + std::to_string(device) + " has an IR length of " + std::to_string(irLength) + ", but " +
                   text + " has " + std::to_string(data.bits.size()) + " bits");
}

// A device shift pads with every other device's BYPASS: each IR length on
// the chain must be known, or the bits land in the wrong places.
void requireKnownIRLengths(unsigned handle, unsigned count)
{
    for (unsigned i = 0; i < count; ++i) {
        unsigned irLength = 0;
        if (JEX_FAILED(JexJtag_tap_getIRLength(handle, i, &irLength)))
            throw CliError("cannot read the IR length of device " + std::to_string(i));
        if (irLength != 0 && irLength <= 4096) continue;
        char bits[33] = {};
        JexJtag_tap_getDeviceIdcode(handle, i, bits, sizeof bits);
        const std::optional<uint32_t> idcode = idcodeFromBits(bits);
        throw CliError("the IR length of device " + std::to_string(i) + " (IDCODE " +
                       (idcode ? idcodeHex(*idcode) : std::string(bits)) +
                       ") is unknown: the device list does not know it.  Give it in an idcode.lst of your own "
                       "(--datadir DIR), or keep the lengths the cable found with --no-autodetect");
    }
}

// One shift; TDO comes back.  With tdi not written (read only) TDI stays 0.
BitVector shift(unsigned handle, bool ir, const std::optional<unsigned>& device, const BitVector& tdi, bool write,
                unsigned exitState)
{
    const unsigned bitCount = tdi.size();
    const unsigned mode = write ? JEXJTAG_SHIFT_READWRITE : JEXJTAG_SHIFT_READ;
    BitVector tdo(bitCount);
    uint32_t status = JEX_FAILURE;
    if (device) {
        const auto op = ir ? JexJtag_tap_shiftDeviceIR : JexJtag_tap_shiftDeviceDR;
        status = op(handle, *device, mode, exitState, nullptr, bitCount, tdi.data(), tdo.data(), nullptr, nullptr);
    } else {
        const auto op = ir ? JexJtag_tap_shiftChainIR : JexJtag_tap_shiftChainDR;
        status = op(handle, mode, exitState, nullptr, bitCount, tdi.data(), tdo.data(), nullptr, nullptr);
    }
    if (JEX_FAILED(status)) throw CliError("shifting " + registerText(ir, device) + " failed");
    return BitVector::fromBytes(tdo.data(), bitCount);
}

void runShift(const Options& options, MessageSink& sink, std::ostream& out)
{
    const ShiftRequest request = readRequest(options);
    const bool ir = request.ir;
    const bool hasData = request.data.has_value();
    const std::string dataText = request.data.value_or(std::string());
    DataValue data;
    if (hasData) data = parseData(dataText, request.bits);
    else data.bits = BitVector(request.bits.value_or(0));
    std::optional<DataValue> instruction;
    if (request.irData) instruction = parseData(*request.irData, std::nullopt);

    ShiftResult result;
    result.reg = ir ? "ir" : "dr";
    result.device = request.device;
    result.exitState = request.exitState;
    {
        LibrarySession session(options, sink);
        TargetConnection target(session, options);
        const unsigned handle = target.handle();
        if (!options.noLock) target.lock(options.lockWaitMs);
        if (request.device) {
            const unsigned device = *request.device;
            detectChain(handle, !request.noAutodetect);
            const unsigned count = chainDeviceCount(handle);
            if (device >= count)
                throw CliError("there is no device " + std::to_string(device) + ": the chain has " +
                               std::to_string(count) + (count == 1 ? " device" : " devices"));
            requireKnownIRLengths(handle, count);
            if (ir) fitToInstructionRegister(data, dataText, request.bits.has_value(), handle, device);
            if (instruction) fitToInstructionRegister(*instruction, *request.irData, false, handle, device);
        }
        if (instruction) {
            const BitVector irTdo = shift(handle, true, request.device, instruction->bits, true, JEXJTAG_RUN_TEST_IDLE);
            result.instruction = ShiftResult::Instruction{instruction->notation, instruction->bits, irTdo};
        }
        result.tdo = shift(handle, ir, request.device, data.bits, hasData, request.exitState);
    }
    result.notation = data.notation;
    if (hasData) result.tdi = data.bits;
    if (options.json) writeShiftJson(out, result);
    else writeShiftText(out, result);
}

} // namespace

extern const Command shiftCommand = {
    "shift", "shift ir|dr DATA", "shift an instruction or data register and print TDO",
    {
        {"device", 'd', true, checkNumberValue},
        {"bits", 'n', true, checkNumberValue},
        {"exit", 0, true, [](const std::string&, const std::string& value) { parseTapState(value); }},
        {"ir", 0, true, [](const std::string&, const std::string& value) {
             if (value.empty()) throw UsageError("--ir needs the instruction to shift");
         }},
        {"no-autodetect", 0, false},
    },
    1, 2, "needs ir or dr and the data to shift",
    [](const Options& options) { readRequest(options); },
    [] { return std::string(kShiftHead) + tapStateNameList() + kShiftTail; },
    runShift,
};

} // namespace jexjtag::cli
