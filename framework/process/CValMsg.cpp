#include "framework/process/CValMsg.h"

namespace Tarsa {

template class CValMsg<std::uint32_t>;
template class CValMsg<CObjID>;
template class CValMsg<CNumber>;
template class CValMsg<EButtonValue>;

}  // namespace Tarsa
