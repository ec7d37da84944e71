// Polynomial roots: all 20 roots of a degree-20 polynomial by search and
// deflation (both twins), and the closed form of degree 5 for scale.  Each
// iteration copies the coefficients back first, which the figures include.
// vlxi_proots leaves its two work vectors behind by design, so a run grows
// by a few hundred bytes per iteration.
#include "libvlx.h"

#include <benchmark/benchmark.h>

#include <complex>
#include <random>
#include <vector>

namespace {

// Monic coefficients of ten real roots and five conjugate pairs in [-2, 2].
std::vector<double> coefficients(int degree) {
    std::mt19937 rng(11);
    std::uniform_real_distribution<double> u(-2, 2);
    std::vector<std::complex<double>> c{1.0};
    for (int i = 0; i < degree;) {
        std::vector<std::complex<double>> roots;
        if (i % 4 == 0 && degree - i >= 2) {
            const std::complex<double> z(u(rng), u(rng));
            roots = {z, std::conj(z)};
        } else {
            roots = {u(rng)};
        }
        for (const auto& r : roots) {
            c.push_back(0.0);
            for (size_t k = c.size() - 1; k > 0; --k) c[k] = c[k - 1] - r * c[k];
            c[0] = -r * c[0];
        }
        i += static_cast<int>(roots.size());
    }
    std::vector<double> out;
    for (const auto& x : c) out.push_back(x.real());
    return out;
}

template <class V>
struct Poly {
    V coef, work;
    explicit Poly(int degree) {
        const auto a = coefficients(degree);
        if constexpr (std::is_same_v<V, vlx_t>) vlx_init(&coef), vlx_init(&work); else vlxf_init(&coef), vlxf_init(&work);
        coef.points = static_cast<int32_t>(a.size());
        if constexpr (std::is_same_v<V, vlx_t>) vlx_alloc(&coef); else vlxf_alloc(&coef);
        for (size_t i = 0; i < a.size(); ++i) coef.data[i] = static_cast<decltype(+coef.data[0])>(a[i]);
    }
    ~Poly() {
        if constexpr (std::is_same_v<V, vlx_t>) vlx_destroy(&coef), vlx_destroy(&work); else vlxf_destroy(&coef), vlxf_destroy(&work);
    }
};

template <class V>
void BM_iproots(benchmark::State& state) {
    Poly<V> p(static_cast<int>(state.range(0)));
    for (auto _ : state) {
        if constexpr (std::is_same_v<V, vlx_t>) {
            vlx_copy(&p.work, &p.coef);
            vlxi_proots(&p.work);
        } else {
            vlxf_copy(&p.work, &p.coef);
            vlxfi_proots(&p.work);
        }
        benchmark::DoNotOptimize(p.work.data[0]);
    }
}

void BM_proots_quintic(benchmark::State& state) {
    Poly<vlx_t> p(5);
    for (auto _ : state) {
        vlxs_proots(&p.coef, &p.work);
        benchmark::DoNotOptimize(p.work.data[0]);
    }
}

}  // namespace

BENCHMARK(BM_iproots<vlx_t>)->Arg(20);
BENCHMARK(BM_iproots<vlxf_t>)->Arg(20);
BENCHMARK(BM_proots_quintic);

BENCHMARK_MAIN();
