/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * TARN_GPU_API marks what libtarn_rng.so shows of the device services, in C and in C++. */
#ifndef TARN_GPU_API_H
#define TARN_GPU_API_H

/** \cond */
#define TARN_GPU_API __attribute__((visibility("default")))
/** \endcond */

#endif
