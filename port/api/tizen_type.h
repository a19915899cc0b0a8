/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PORT_API_TIZEN_TYPE_H
#define PORT_API_TIZEN_TYPE_H

#include <stdbool.h>

#endif
