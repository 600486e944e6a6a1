// The banded error diffusions of the AC4 members.
#include "reduce_bits/reduce_drivers.h"

namespace zel::reduce {

ZEL_REDUCE_BANDS_LAYOUT(, AC4)

}  // namespace zel::reduce
