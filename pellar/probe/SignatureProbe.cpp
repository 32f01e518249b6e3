// SPDX-License-Identifier: Apache-2.0
#include "pellar/probe/SignatureProbe.h"

#include <blkid/blkid.h>

#include <memory>

namespace pellar {

Signature probeSignature(int descriptor, std::uint64_t offset, std::uint64_t length)
{
    const std::unique_ptr<blkid_struct_probe, decltype(&::blkid_free_probe)> probe(
        ::blkid_new_probe(), &::blkid_free_probe);
    if (!probe ||
        ::blkid_probe_set_device(probe.get(), descriptor, static_cast<blkid_loff_t>(offset),
                                 static_cast<blkid_loff_t>(length)) != 0)
        return {};
    ::blkid_probe_enable_superblocks(probe.get(), 1);
    ::blkid_probe_set_superblocks_flags(probe.get(), BLKID_SUBLKS_TYPE);
    constexpr int ambivalent = -2;
    const int result = ::blkid_do_safeprobe(probe.get());
    const char* type = nullptr;
    if (result == 0)
        ::blkid_probe_lookup_value(probe.get(), "TYPE", &type, nullptr);
    return {type == nullptr ? "" : type, result == ambivalent};
}

}  // namespace pellar
