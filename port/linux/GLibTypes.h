// SPDX-License-Identifier: Apache-2.0
#include "../common/GLibTypes.h" // IWYU pragma: export
