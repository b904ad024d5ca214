#include "ShiftCommand.hpp"

#include "ChainReader.hpp"
#include "CliError.hpp"
#include "DataText.hpp"
#include "Idcode.hpp"
#include "LibrarySession.hpp"
#include "ShiftOutput.hpp"
#include "TargetConnection.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

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

} // namespace

void runShift(const Options& options, MessageSink& sink, std::ostream& out)
{
    const bool ir = options.operands.at(0) == "ir";
    const bool hasData = options.operands.size() == 2;
    const std::string dataText = hasData ? options.operands[1] : std::string();
    DataValue data;
    if (hasData) data = parseData(dataText, options.bits);
    else data.bits = BitVector(options.bits.value_or(0));
    std::optional<DataValue> instruction;
    if (options.irData) instruction = parseData(*options.irData, std::nullopt);

    ShiftResult result;
    result.reg = ir ? "ir" : "dr";
    result.device = options.device;
    result.exitState = options.exitState;
    {
        LibrarySession session(options, sink);
        TargetConnection target(session, options);
        const unsigned handle = target.handle();
        if (!options.noLock) target.lock(options.lockWaitMs);
        if (options.device) {
            detectChain(handle, !options.noAutodetect);
            const unsigned count = chainDeviceCount(handle);
            if (*options.device >= count)
                throw CliError("there is no device " + std::to_string(*options.device) + ": the chain has " +
                               std::to_string(count) + (count == 1 ? " device" : " devices"));
            requireKnownIRLengths(handle, count);
            if (ir) fitToInstructionRegister(data, dataText, options.bits.has_value(), handle, *options.device);
            if (instruction) fitToInstructionRegister(*instruction, *options.irData, false, handle, *options.device);
        }
        if (instruction) {
            const BitVector irTdo = shift(handle, true, options.device, instruction->bits, true, JEXJTAG_RUN_TEST_IDLE);
            result.instruction = ShiftResult::Instruction{instruction->notation, instruction->bits, irTdo};
        }
        result.tdo = shift(handle, ir, options.device, data.bits, hasData, options.exitState);
    }
    result.notation = data.notation;
    if (hasData) result.tdi = data.bits;
    if (options.json) writeShiftJson(out, result);
    else writeShiftText(out, result);
}

} // namespace jexjtag::cli
