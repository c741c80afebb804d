// Error codes that calls throw.
#pragma once

#include <ZR/types.h>

// The code that `call` throws; 0 when it throws none.
template <class Call>
i32 thrown_by(Call&& call) {
  try {
    call();
  } catch (const i32 code) {
    return code;
  }
  return 0;
}
