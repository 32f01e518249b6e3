// SPDX-License-Identifier: Apache-2.0
extern "C" int somethingElse()
{
    return 1;
}
