#include "ShiftCommand.hpp"

#include "ChainReader.hpp"
#include "CliError.hpp"
#include "DataText.hpp"
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

// A device's IR shift takes the device's IR length: hexadecimal data given
// without --bits is fitted to it; any other length that differs is refused.
void fitToInstructionRegister(DataValue& data, const Options& options, unsigned handle, unsigned device)
{
    unsigned irLength = 0;
    if (JEX_FAILED(JexJtag_tap_getIRLength(handle, device, &irLength)))
        throw CliError("cannot read the IR length of device " + std::to_string(device));
    if (irLength == 0 || data.bits.size() == irLength) return;
    const bool hasData = options.operands.size() == 2;
    if (hasData && !options.bits && data.notation == DataNotation::Hex) {
        try {
            data = parseData(options.operands[1], irLength);
            return;
        } catch (const UsageError&) {
            throw CliError("data " + options.operands[1] + " does not fit into the " + std::to_string(irLength) +
                           "-bit instruction register of device " + std::to_string(device));
        }
    }
    throw CliError("device " + std::to_string(device) + " has an IR length of " + std::to_string(irLength) + ", but " +
                   std::to_string(data.bits.size()) + " bits were given");
}

} // namespace

void runShift(const Options& options, MessageSink& sink, std::ostream& out)
{
    const bool ir = options.operands.at(0) == "ir";
    const bool hasData = options.operands.size() == 2;
    DataValue data;
    if (hasData) data = parseData(options.operands[1], options.bits);
    else data.bits = BitVector(options.bits.value_or(0));

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
            if (ir) fitToInstructionRegister(data, options, handle, *options.device);
        }

        const unsigned bitCount = data.bits.size();
        const unsigned mode = hasData ? JEXJTAG_SHIFT_READWRITE : JEXJTAG_SHIFT_READ;
        BitVector tdo(bitCount);
        uint32_t status = JEX_FAILURE;
        if (options.device) {
            const auto shift = ir ? JexJtag_tap_shiftDeviceIR : JexJtag_tap_shiftDeviceDR;
            status = shift(handle, *options.device, mode, options.exitState, nullptr, bitCount, data.bits.data(),
                           tdo.data(), nullptr, nullptr);
        } else {
            const auto shift = ir ? JexJtag_tap_shiftChainIR : JexJtag_tap_shiftChainDR;
            status = shift(handle, mode, options.exitState, nullptr, bitCount, data.bits.data(), tdo.data(), nullptr,
                           nullptr);
        }
        if (JEX_FAILED(status)) throw CliError("shifting " + registerText(ir, options.device) + " failed");
        result.tdo = BitVector::fromBytes(tdo.data(), bitCount);
    }
    result.notation = data.notation;
    if (hasData) result.tdi = data.bits;
    if (options.json) writeShiftJson(out, result);
    else writeShiftText(out, result);
}

} // namespace jexjtag::cli
