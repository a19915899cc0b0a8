// SPDX-License-Identifier: Apache-2.0
// Has the headers that all tests share compiled beforehand.
