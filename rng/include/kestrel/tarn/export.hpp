// SPDX-License-Identifier: Apache-2.0
// TARN_EXPORT marks what the library shows; everything else is built with hidden visibility.
#pragma once

#if defined(__GNUC__)
#define TARN_EXPORT __attribute__((visibility("default")))
#else
#define TARN_EXPORT
#endif
