// SPDX-License-Identifier: Apache-2.0
// The shared object of a bundle that the loader's tests load.
#define EXPORTED extern "C" __attribute__((visibility("default")))

EXPORTED void* makeSample(const void* allocator, const void* type) {
    static int sample;
    return allocator == nullptr && type != nullptr ? &sample : nullptr;
}

EXPORTED void* makeNothing(const void*, const void*) {
    return nullptr;
}
