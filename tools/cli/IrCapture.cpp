// SPDX-License-Identifier: MIT
#include "IrCapture.hpp"

#include <cstddef>

namespace jexjtag::cli {

IrInference splitIrCapture(const std::vector<bool>& capture, unsigned deviceCount)
{
    IrInference result;
    const std::size_t total = capture.size();
    if (deviceCount == 0) {
        result.ok = total == 0;
        if (!result.ok) result.error = "no device is left for " + std::to_string(total) + " IR bits";
        return result;
    }
    if (total < 2u * deviceCount) {
        result.error = "the IR capture shows " + std::to_string(total) + " bits, too few for " +
                       std::to_string(deviceCount) + " devices";
        return result;
    }
    std::vector<std::size_t> starts;
    for (std::size_t p = 0; p + 1 < total; ++p)
        if (capture[p] && !capture[p + 1]) starts.push_back(p);
    if (starts.empty() || starts[0] != 0) {
        result.error = "the IR bits do not begin with the captured binary 01";
        return result;
    }
    if (starts.size() < deviceCount) {
        result.error = "the IR capture shows " + std::to_string(starts.size()) + " instruction registers for " +
                       std::to_string(deviceCount) + " devices";
        return result;
    }
    std::vector<unsigned> pieces;
    for (std::size_t i = 0; i < starts.size(); ++i)
        pieces.push_back(static_cast<unsigned>((i + 1 < starts.size() ? starts[i + 1] : total) - starts[i]));
    result.ambiguous = pieces.size() > deviceCount;
    while (pieces.size() > deviceCount) {
        std::size_t best = 0;
        for (std::size_t i = 1; i + 1 < pieces.size(); ++i)
            if (pieces[i] + pieces[i + 1] < pieces[best] + pieces[best + 1]) best = i;
        pieces[best] += pieces[best + 1];
        pieces.erase(pieces.begin() + static_cast<std::ptrdiff_t>(best) + 1);
    }
    result.lengths = std::move(pieces);
    result.ok = true;
    return result;
}

IrInference inferUnknownIrLengths(const std::vector<bool>& capture, const std::vector<unsigned>& known)
{
    const std::size_t n = known.size();
    std::size_t first = n, last = 0, runs = 0;
    unsigned knownSum = 0;
    for (std::size_t i = 0; i < n; ++i) {
        knownSum += known[i];
        if (known[i] != 0) continue;
        if (first == n) first = i;
        if (i == 0 || known[i - 1] != 0) ++runs;
        last = i;
    }
    IrInference result;
    if (first == n) { // nothing to infer
        result.ok = true;
        result.lengths = known;
        return result;
    }
    if (knownSum >= capture.size()) {
        result.error = "the known IR lengths leave no bits of the IR capture for the other devices";
        return result;
    }
    if (runs == 1) {
        unsigned before = 0;
        for (std::size_t i = 0; i < first; ++i) before += known[i];
        const std::size_t end = capture.size() - (knownSum - before);
        const std::vector<bool> piece(capture.begin() + before, capture.begin() + static_cast<std::ptrdiff_t>(end));
        IrInference split = splitIrCapture(piece, static_cast<unsigned>(last - first + 1));
        if (!split.ok) return split;
        result = split;
        result.ambiguous = split.ambiguous && first != last; // one device: the segment is its IR
        result.lengths = known;
        for (std::size_t i = first; i <= last; ++i) result.lengths[i] = split.lengths[i - first];
        return result;
    }
    IrInference whole = splitIrCapture(capture, static_cast<unsigned>(n));
    if (!whole.ok) return whole;
    std::size_t sum = 0;
    for (std::size_t i = 0; i < n; ++i) {
        if (known[i] != 0 && known[i] != whole.lengths[i]) whole.ambiguous = true;
        if (known[i] != 0) whole.lengths[i] = known[i];
        sum += whole.lengths[i];
    }
    if (sum != capture.size()) {
        result.error = "the known IR lengths do not fit the IR capture";
        return result;
    }
    return whole;
}

} // namespace jexjtag::cli
