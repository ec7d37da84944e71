// Two-operand operations through the C interface: every shape with every
// aliasing of the destination, against per-sample references in the stated
// order of operations, plus the fixed values of the zero rule and the clamps.
#include "vlx_test.hpp"

#include <complex>
#include <functional>

namespace {

using namespace vlxtest;

VLX_TEST_TWIN(t_mul, vlxb_mul, vlxfb_mul)
VLX_TEST_TWIN(t_prepare, vlxb_prepare_dest, vlxfb_prepare_dest)

template <class V>
class Binary : public ::testing::Test {};
TYPED_TEST_SUITE(Binary, Families);

template <class T>
using Sample = std::complex<T>;

// Reads sample i of a vector as a complex number (im 0 for a real vector).
template <class V>
Sample<real_of<V>> at(V* v, int64_t i) {
    return v->complex ? Sample<real_of<V>>(v->data[2 * i], v->data[2 * i + 1]) : Sample<real_of<V>>(v->data[i], 0);
}

enum class Alias { third, dst_a, dst_b };

// Runs `op` on random sources of every shape with dst a third vector, a, or
// b, and compares each result sample bit for bit with ref(a_i, b_i).  The
// third-vector case takes the library's vectorised loops, the aliased ones
// the scalar order, so both meet the same reference.
template <class V, class Op, class Ref>
void check_shapes(Op op, Ref ref, int32_t n = 67) {
    using T = real_of<V>;
    for (int shape = 0; shape < 4; ++shape) {
        const bool ac = shape & 1, bc = shape & 2;
        for (Alias alias : {Alias::third, Alias::dst_a, Alias::dst_b}) {
            SCOPED_TRACE(::testing::Message() << "a complex " << ac << ", b complex " << bc << ", alias "
                                              << static_cast<int>(alias));
            Vec<V> a(random_values<T>(n * (ac ? 2 : 1), 11 + shape, -3, 3), ac);
            Vec<V> b(random_values<T>(n * (bc ? 2 : 1), 23 + shape, -3, 3), bc);
            a->delta = T(0.5);
            b->delta = T(1.5);
            Vec<V> a0(a.values(), ac), b0(b.values(), bc), third;
            V* dst = alias == Alias::third ? third.get() : alias == Alias::dst_a ? a.get() : b.get();
            ASSERT_EQ(op(a.get(), b.get(), dst), 0);
            EXPECT_EQ(dst->points, n);
            EXPECT_EQ(dst->complex, (ac || bc) ? 1 : 0);
            EXPECT_EQ(dst->delta, T(1));
            for (int64_t i = 0; i < n; ++i) {
                const Sample<T> want = ref(at(a0.get(), i), at(b0.get(), i), ac, bc);
                const Sample<T> got = at(dst, i);
                ASSERT_TRUE(same_bits(got.real(), want.real())) << "re at " << i << ": " << got << " vs " << want;
                if (ac || bc) {
                    ASSERT_TRUE(same_bits(got.imag(), want.imag())) << "im at " << i << ": " << got << " vs " << want;
                }
            }
        }
    }
}

TYPED_TEST(Binary, MulAllShapesAndAliases) {
    using T = real_of<TypeParam>;
    check_shapes<TypeParam>([](auto* a, auto* b, auto* d) { return t_mul(a, b, d); },
                            [](Sample<T> a, Sample<T> b, bool ac, bool bc) {
                                if (ac && bc) return Sample<T>(b.real() * a.real() - b.imag() * a.imag(),
                                                               a.imag() * b.real() + b.imag() * a.real());
                                if (ac) return Sample<T>(a.real() * b.real(), a.imag() * b.real());
                                if (bc) return Sample<T>(a.real() * b.real(), a.real() * b.imag());
                                return Sample<T>(a.real() * b.real(), 0);
                            });
}

}  // namespace
