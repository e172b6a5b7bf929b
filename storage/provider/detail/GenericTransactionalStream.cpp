#include <storage/provider/detail/GenericTransactionalStream.hpp>

namespace foundation::storage::provider::detail {

template class GenericTransactionalStream<ByteStream>;

} // namespace foundation::storage::provider::detail
