// SPDX-License-Identifier: Apache-2.0
//
// The floor of every command: a C++ program that is linked like any other and does nothing. What it takes from start to
// exit is what the machine asks for a process.

int main() {
    return 0;
}
