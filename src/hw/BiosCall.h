// The firmware's call interface through the management service: a command with input bytes, and an answer of one of
// five sizes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace panelglow {

/// `sizeIndex` picks the size of the answer: 0, 4, 128, 1024 or 4096 bytes. Throws InvalidTmbWMIException for a step
/// that fails, a short answer included, and InvalidTmbWMICallException, with the command and what stands in place of
/// the signature, when the firmware does not sign its answer.
std::vector<std::uint8_t> CallBios(std::uint32_t command, std::uint32_t commandType,
                                   const std::vector<std::uint8_t>& inputBytes, std::size_t sizeIndex);

}  // namespace panelglow
