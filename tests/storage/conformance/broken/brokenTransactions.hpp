#pragma once

#include <tests/storage/conformance/broken/Misbehaviour.hpp>

namespace foundation::storage::conformance::broken {

/// Transactions that go wrong in more than one table; each opens one for `openTransactionalStream`.
Transaction committingOnDrop(Store store, Iri iri, Options options);
Transaction committingOnAbort(Store store, Iri iri, Options options);
Transaction addingAByte(Store store, Iri iri, Options options);
Transaction writingInPlace(Store store, Iri iri, Options options);
Transaction litteringWhenAborted(Store store, Iri iri, Options options);

} // namespace foundation::storage::conformance::broken
