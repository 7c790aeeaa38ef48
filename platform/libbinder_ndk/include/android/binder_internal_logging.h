// SPDX-License-Identifier: Apache-2.0
//
// <syslog.h> for the inline functions of these headers. It and the log library both define LOG_PRI,
// and the log library's meaning is kept when it was included first.
#pragma once

#pragma push_macro("LOG_PRI")
#ifdef LOG_PRI
#undef LOG_PRI
#endif
#include <syslog.h>
#pragma pop_macro("LOG_PRI")
