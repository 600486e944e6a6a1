// The banded error diffusions of the C3 members.
#include "reduce_bits/reduce_drivers.h"

namespace zel::reduce {

ZEL_REDUCE_BANDS_LAYOUT(, C3)

}  // namespace zel::reduce
