// SPDX-License-Identifier: Apache-2.0
// Does nothing; GIO is linked all the same.
int main() {}
