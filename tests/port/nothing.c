/* SPDX-License-Identifier: Apache-2.0 */
/* What is compiled after a platform header, to see that the header compiles alone. */
typedef int nothing; /* ISO C wants at least one declaration */
