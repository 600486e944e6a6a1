// The banded error diffusions of the C1 members.
#include "reduce_bits/reduce_drivers.h"

namespace zel::reduce {

ZEL_REDUCE_BANDS_LAYOUT(, C1)

}  // namespace zel::reduce
