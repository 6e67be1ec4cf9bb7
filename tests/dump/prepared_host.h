#pragma once

#include "tests/support/fake_platform.h"

namespace zal::testing {

/// Fills every place that collections take from: with files that belong into a dump, and beside each
/// kind with one that only looks so (its name says "other"). A shell command leaves an empty output
/// file, as a real shell would.
void prepareHost(FakePlatform& host);

}  // namespace zal::testing
