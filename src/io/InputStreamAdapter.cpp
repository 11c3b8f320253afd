#include "io/InputStreamAdapter.h"

namespace KVR {

template class IInputStreamAdapter<IO::Detail::VVectorReader>;

} // namespace KVR
