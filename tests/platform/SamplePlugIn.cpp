// The shared object of a bundle that the loader's tests load.
namespace {

int instances = 0;

} // namespace

#define EXPORTED extern "C" __attribute__((visibility("default")))

EXPORTED void* makeSample(const void* allocator, const void* type) {
    return allocator == nullptr && type != nullptr ? &++instances : nullptr;
}

EXPORTED void* makeNothing(const void*, const void*) {
    return nullptr;
}
