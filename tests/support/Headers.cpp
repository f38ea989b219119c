// SPDX-License-Identifier: Apache-2.0
// Exists only to precompile the headers that tests share.
int main() {}
