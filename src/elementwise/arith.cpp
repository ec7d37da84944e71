// The in-place arithmetic and math family.
#include "elementwise/elementwise.hpp"

namespace vlx {

template <VlxVector V>
int32_t scale(V* v, real_t<V> s) {
    if (v->points < 1) return 0;
    const int64_t n = scalar_count(v);
    real_t<V>* d = v->data;
    for (int64_t i = 0; i < n; ++i) d[i] = d[i] * s;
    return 0;
}

template int32_t scale<vlx_t>(vlx_t*, double);
template int32_t scale<vlxf_t>(vlxf_t*, float);

}  // namespace vlx

extern "C" {
VLX_API int32_t vlxi_scale(vlx_t* v, double s) { return vlx::scale(v, s); }
VLX_API int32_t vlxfi_scale(vlxf_t* v, float s) { return vlx::scale(v, s); }
}
