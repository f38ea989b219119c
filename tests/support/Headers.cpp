// SPDX-License-Identifier: Apache-2.0
// Nothing but a place for the headers that tests share in precompiled form.
int main() {}
