#ifndef HPN_RUNTIME_H
#define HPN_RUNTIME_H

/*
 * Arithmetic of generated control code, for the places where plain C operators could give another number or have no
 * defined result. Every number of the source program is a double; integers of up to 32 bits are computed in int32_t or
 * int64_t where that gives the same number.
 *
 * All functions are total: they have a defined result for every argument, infinities and NaN included. The header is C99
 * and C++; it needs IEEE 754 doubles, two's complement exact-width integers and no library.
 *
 * Names end in the width of integer forms (hpn_min32); the form without a width computes with doubles.
 */

#include <stdint.h>

#ifdef __clang__
/* A fused multiply-add rounds once where the source program rounds twice. */
#pragma STDC FP_CONTRACT OFF
#endif

/* ---- numbers that have no literal ---- */

static inline double hpn_from_bits(uint64_t bits) {
    union {
        uint64_t bits;
        double number;
    } view;
    view.bits = bits;
    return view.number;
}

static inline double hpn_infinity(void) { return hpn_from_bits(UINT64_C(0x7ff0000000000000)); }
static inline double hpn_quiet_nan(void) { return hpn_from_bits(UINT64_C(0x7ff8000000000000)); }

/* One and the same bit pattern for every NaN. */
static inline double hpn_nan(double x) { return x != x ? hpn_quiet_nan() : x; }

/* ---- conversions to integers: toward zero; what does not fit becomes the smallest number ---- */

static inline int32_t hpn_int32(double x) {
    return x > -2147483649.0 && x < 2147483648.0 ? (int32_t)x : INT32_MIN;
}

static inline int64_t hpn_int64(double x) {
    return x >= -9223372036854775808.0 && x < 9223372036854775808.0 ? (int64_t)x : INT64_MIN;
}

static inline int32_t hpn_int32_of64(int64_t x) {
    return x >= INT32_MIN && x <= INT32_MAX ? (int32_t)x : INT32_MIN;
}

/* The nearest whole number, halves away from zero. */
static inline int64_t hpn_round(double x) {
    int64_t whole = hpn_int64(x);
    double rest = x - (double)whole;
    if (whole == INT64_MIN) {
        return whole;
    }
    return rest >= 0.5 ? whole + 1 : rest <= -0.5 ? whole - 1 : whole;
}

/* The raw number that stands for x in a storage scaled by raw * lsb + offset. */
static inline int64_t hpn_raw(double x, double lsb, double offset) {
    return hpn_round((x - offset) / lsb);
}

/* ---- conversions to floating types: a variable never holds a negative zero ---- */

static inline double hpn_double(double x) { return x == 0.0 ? 0.0 : x; }

static inline float hpn_float(double x) {
    float single = (float)x;
    return single == 0.0f ? 0.0f : single;
}

/* ---- limits: the upper one is looked at first; a NaN passes ---- */

static inline double hpn_clip_high(double x, double high) { return x > high ? high : x; }
static inline double hpn_clip_low(double x, double low) { return low > x ? low : x; }
static inline double hpn_clip(double x, double low, double high) {
    return x > high ? high : low > x ? low : x;
}
static inline int32_t hpn_clip32(int32_t x, int32_t low, int32_t high) {
    return x > high ? high : low > x ? low : x;
}
static inline int64_t hpn_clip64(int64_t x, int64_t low, int64_t high) {
    return x > high ? high : low > x ? low : x;
}

/* Index of an element of an array of count elements. */
static inline int32_t hpn_index(int32_t index, int32_t count) {
    return index < 0 ? 0 : index < count ? index : count - 1;
}

/* ---- arithmetic ---- */

/* Zero times anything is zero, infinities and NaN included. */
static inline double hpn_mul(double a, double b) { return a == 0.0 || b == 0.0 ? 0.0 : a * b; }
/* Zero divided by anything is zero, zero included. */
static inline double hpn_div(double a, double b) { return a == 0.0 ? 0.0 : a / b; }

static inline double hpn_min(double a, double b) { return b > a ? a : b; }
static inline int32_t hpn_min32(int32_t a, int32_t b) { return b > a ? a : b; }
static inline int64_t hpn_min64(int64_t a, int64_t b) { return b > a ? a : b; }
static inline double hpn_max(double a, double b) { return a > b ? a : b; }
static inline int32_t hpn_max32(int32_t a, int32_t b) { return a > b ? a : b; }
static inline int64_t hpn_max64(int64_t a, int64_t b) { return a > b ? a : b; }
static inline double hpn_abs(double x) { return 0.0 > x ? -x : x; }
/* x must not be INT32_MIN, INT64_MIN. */
static inline int32_t hpn_abs32(int32_t x) { return x < 0 ? -x : x; }
static inline int64_t hpn_abs64(int64_t x) { return x < 0 ? -x : x; }
static inline int32_t hpn_sgn(double x) { return 0.0 > x ? -1 : x > 0.0 ? 1 : 0; }
static inline int32_t hpn_sgn32(int32_t x) { return x < 0 ? -1 : x > 0 ? 1 : 0; }
static inline int32_t hpn_sgn64(int64_t x) { return x < 0 ? -1 : x > 0 ? 1 : 0; }

/* The remainder has the sign of a; zero divisors give 0. */
static inline int32_t hpn_mod(int32_t a, int32_t b) { return b == 0 || b == -1 ? 0 : a % b; }

/* The number itself, where a plain expression would look like a slip to compilers. */
static inline int32_t hpn_value32(int32_t x) { return x; }
static inline int32_t hpn_not(int32_t x) { return -1 - x; }

/* Only the low five bits of a shift count matter; a shift to the right copies the sign bit in. */
static inline int32_t hpn_shl(int32_t a, int32_t count) {
    uint32_t bits = (uint32_t)a << ((uint32_t)count & 31u);
    return bits <= (uint32_t)INT32_MAX ? (int32_t)bits : -(int32_t)~bits - 1;
}
static inline int32_t hpn_shr(int32_t a, int32_t count) {
    uint32_t shift = (uint32_t)count & 31u;
    return a < 0 ? ~(int32_t)((uint32_t)~a >> shift) : (int32_t)((uint32_t)a >> shift);
}

#endif
