// Result codes shared by the kernel, the system library and TarnCommandBinder.
//
// Results are HRESULT-style 32-bit values carried in a `long`: zero or positive is success,
// negative is failure. `long` is 64 bits wide here, so every failure code is sign-extended from its
// 32-bit form; compare with `< 0` or with these constants, never with a bare hexadecimal literal.
#ifndef NIMBO_RESULTCODES_H_
#define NIMBO_RESULTCODES_H_

#include <cstdint>

// Success.
constexpr long S_OK = 0;
// Success with nothing done; also what a module's createCommand returns when the command instance
// for the given call already exists.
constexpr long S_FALSE = 1;
// The general failure.
constexpr long E_FAIL = static_cast<long>(static_cast<std::int32_t>(0x80004005u));
// The operation is not implemented.
constexpr long E_NOTIMPL = static_cast<long>(static_cast<std::int32_t>(0x80004001u));

#endif  // NIMBO_RESULTCODES_H_
