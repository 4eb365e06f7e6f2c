// Calling every exported function the same way, whether it returns a result code or nothing.
#pragma once

#include <cstdint>
#include <type_traits>

namespace pfx::test {

constexpr int32_t kNoCode = -1;  // what a call that returns nothing reports

// The call's result code, or kNoCode for a function that returns nothing.
template <class Call>
int32_t code_of(Call&& call) {
  if constexpr (std::is_void_v<std::invoke_result_t<Call>>) {
    call();
    return kNoCode;
  } else {
    return call();
  }
}

}  // namespace pfx::test
