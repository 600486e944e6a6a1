// The banded error diffusions of the C4 members.
#include "reduce_bits/reduce_drivers.h"

namespace zel::reduce {

ZEL_REDUCE_BANDS_LAYOUT(, C4)

}  // namespace zel::reduce
