// Layout operations: where the samples of a vector stand.
#include "elementwise/elementwise.hpp"

#include <utility>

namespace vlx {

template <VlxVector V>
int32_t real_part(V* v) {
    if (!v->complex) return 0;
    v->complex = 0;
    real_t<V>* d = v->data;
    // forward walk: sample k takes scalar 2k
    for (int64_t k = 0; k < v->points; ++k) d[k] = d[2 * k];
    return 0;
}

template <VlxVector V>
int32_t rev(V* v) {
    const int64_t n = v->points;
    real_t<V>* d = v->data;
    if (v->complex) {
        for (int64_t k = 0; k < n / 2; ++k) {
            std::swap(d[2 * k], d[2 * (n - 1 - k)]);
            std::swap(d[2 * k + 1], d[2 * (n - 1 - k) + 1]);
        }
    } else {
        for (int64_t k = 0; k < n / 2; ++k) std::swap(d[k], d[n - 1 - k]);
    }
    return 0;
}

template int32_t real_part<vlx_t>(vlx_t*);
template int32_t real_part<vlxf_t>(vlxf_t*);
template int32_t rev<vlx_t>(vlx_t*);
template int32_t rev<vlxf_t>(vlxf_t*);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_real(vlx_t* v) { return vlx::real_part(v); }
VLX_API int32_t vlxfi_real(vlxf_t* v) { return vlx::real_part(v); }
VLX_API int32_t vlxi_rev(vlx_t* v) { return vlx::rev(v); }
VLX_API int32_t vlxfi_rev(vlxf_t* v) { return vlx::rev(v); }
}
