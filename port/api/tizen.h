/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PORT_API_TIZEN_H
#define PORT_API_TIZEN_H

#include <tizen_error.h>
#include <tizen_type.h>

#endif
