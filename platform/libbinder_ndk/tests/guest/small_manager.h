// SPDX-License-Identifier: Apache-2.0
//
// A service manager of a few lines for the tests: it registers and looks up, and checks nothing.
#pragma once

#include <functional>

namespace binder_test {

// Becomes the service manager and serves; `ready` is called when others may ask. Does not return.
void serveSmallManager(const std::function<void()>& ready);

}  // namespace binder_test
