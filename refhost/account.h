// What the tables of the host contribute to the account. The caller holds the host's lock.
#ifndef REFHOST_ACCOUNT_H
#define REFHOST_ACCOUNT_H

#include <cstddef>

namespace refhost {

// Paths that are alive and were not counted before.
size_t take_unreported_paths();

}  // namespace refhost

#endif
