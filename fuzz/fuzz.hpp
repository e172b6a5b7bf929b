#pragma once

#include <cstddef>
#include <cstdint>

/// What a fuzz target does with one input. libFuzzer calls it, as does `runInputs.cpp` where libFuzzer is not.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size);
