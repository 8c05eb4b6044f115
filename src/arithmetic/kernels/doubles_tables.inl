// Tables of the functions of double-precision numbers. Computed with 300 bits.
#pragma once

#include "pixel/level.h"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions {

/// The numbers from `from` to its double, cut into equal steps of their bits: a reciprocal near the middle of each, of so
/// few bits that a number times it, less 1, is exact, and minus its logarithm, as a multiple of 2^-42 and a rest.
template <int size>
struct table_of_logarithms {
    double from;
    alignas(64) double reciprocal[size], high[size], low[size];
};

inline constexpr table_of_logarithms<16> logarithms_16 = {
    0x1.78p-1,
    {0x1.58p+0, 0x1.48p+0, 0x1.38p+0, 0x1.3p+0, 0x1.28p+0, 0x1.18p+0, 0x1.1p+0, 0x1.08p+0, 1, 0x1.ep-1,
     0x1.c8p-1, 0x1.bp-1, 0x1.98p-1, 0x1.88p-1, 0x1.7p-1, 0x1.6p-1},
    {-0x1.2e8e2bae12p-2, -0x1.fb9186d5e4p-3, -0x1.9525a9cf46p-3, -0x1.5ff3070a7ap-3, -0x1.29552f82p-3,
     -0x1.6f0d28ae58p-4, -0x1.f0a30c0118p-5, -0x1.f829b0e78p-6, 0, 0x1.08598b59e4p-4, 0x1.da72763844p-4,
     0x1.5bf406b544p-3, 0x1.d1037f2656p-3, 0x1.1178e8227ep-2, 0x1.522ae0738ap-2, 0x1.7fafa3bd81p-2},
    {0x1.67b1e99b72bd8p-45, 0x1.d572aab993c87p-47, 0x1.297137d9f158fp-44, 0x1.8586f183bebf2p-44,
     0x1.5b967f4471dfcp-44, 0x1.4b4641b664613p-44, 0x1.d599e83368e91p-45, -0x1.980267c7e09e4p-45, 0,
     -0x1.7e5dd7009902cp-46, 0x1.a89401fa71733p-46, -0x1.27023eb68981cp-46, -0x1.84a7e75b6f6e4p-47,
     0x1.1ef78ce2d07f2p-44, 0x1.ebe708164c759p-45, 0x1.46fb79bf6d4cbp-44},
};

inline constexpr table_of_logarithms<32> logarithms_32 = {
    0x1.744p-1,
    {0x1.5cp+0, 0x1.54p+0, 0x1.5p+0, 0x1.48p+0, 0x1.4p+0,  0x1.3cp+0, 0x1.34p+0, 0x1.3p+0,
     0x1.28p+0, 0x1.24p+0, 0x1.2p+0, 0x1.1cp+0, 0x1.14p+0, 0x1.1p+0,  0x1.0cp+0, 0x1.08p+0,
     0x1.04p+0, 1,         0x1.fp-1, 0x1.ep-1,  0x1.d4p-1, 0x1.c8p-1, 0x1.b8p-1, 0x1.bp-1,
     0x1.a4p-1, 0x1.98p-1, 0x1.9p-1, 0x1.88p-1, 0x1.7cp-1, 0x1.74p-1, 0x1.6cp-1, 0x1.64p-1},
    {-0x1.3a64c55694p-2, -0x1.22941fbcf8p-2, -0x1.1675cababap-2,
     -0x1.fb9186d5e4p-3, -0x1.c8ff7c79aap-3, -0x1.af3c94e80cp-3,
     -0x1.7ab890210ep-3, -0x1.5ff3070a7ap-3, -0x1.29552f82p-3,
     -0x1.0d77e7cd08p-3, -0x1.e27076e2bp-4,  -0x1.a926d3a4acp-4,
     -0x1.341d7961bcp-4, -0x1.f0a30c0118p-5, -0x1.77458f633p-5,
     -0x1.f829b0e78p-6,  -0x1.fc0a8b0fcp-7,  0,
     0x1.0415d89e78p-5,  0x1.08598b59e4p-4,  0x1.700d30aeacp-4,
     0x1.da72763844p-4,  0x1.365fcb015ap-3,  0x1.5bf406b544p-3,
     0x1.95a5adcf7p-3,   0x1.d1037f2656p-3,  0x1.f991c6cb3cp-3,
     0x1.1178e8227ep-2,  0x1.314f1e1d36p-2,  0x1.4718dc271cp-2,
     0x1.5d5bddf596p-2,  0x1.741d876c68p-2},
    {-0x1.7a71cbcd735dp-44,  0x1.a6976f5eb0963p-44,  -0x1.8380e731f55c4p-44,
     0x1.d572aab993c87p-47,  0x1.7794f689f8434p-45,  0x1.a4e633fcd9066p-52,
     0x1.bdb9072534a58p-45,  0x1.8586f183bebf2p-44,  0x1.5b967f4471dfcp-44,
     -0x1.cb2cd2ee2f482p-44, 0x1.a342c2af0003cp-45,  -0x1.563650bd22a9cp-44,
     -0x1.1d0929983761p-44,  0x1.d599e83368e91p-45,  0x1.181dce586af09p-44,
     -0x1.980267c7e09e4p-45, -0x1.f1e7cf6d3a69cp-50, 0,
     -0x1.dddc7f461c516p-44, -0x1.7e5dd7009902cp-46, 0x1.c1e8da99ded32p-49,
     0x1.a89401fa71733p-46,  -0x1.fd3a0afb9691bp-44, -0x1.27023eb68981cp-46,
     0x1.7f22858a0ff6fp-47,  -0x1.84a7e75b6f6e4p-47, -0x1.90d04cd7cc834p-44,
     0x1.1ef78ce2d07f2p-44,  -0x1.8e27ad3213cb8p-45, 0x1.06c18fb4c14c5p-44,
     -0x1.a0b2a08a465dcp-47, -0x1.13a7b5b11cfa7p-44},
};

/// The logarithms to base 2 that belong to logarithms_16.
alignas(64) inline constexpr double logarithms_2_16[] = {
    -0x1.b47ebf73882a1p-2, -0x1.6e221cd9d0cdep-2, -0x1.24407ab0e073ap-2,
    -0x1.fbc16b902680ap-3, -0x1.acf5e2db4ec94p-3, -0x1.08c588cda79e4p-3,
    -0x1.663f6fac91316p-4, -0x1.6bad3758efd87p-5, 0,
    0x1.7d60496cfbb4cp-4,  0x1.563dc29ffacb2p-3,  0x1.f5fd8a9063e35p-3,
    0x1.4f6fbb2cec598p-2,  0x1.8a8980abfbd32p-2,  0x1.e7df5fe538ab3p-2,
    0x1.14c560fe68af9p-1};

/// 2^(i / 16), rounded, and the rest.
struct table_of_powers {
    alignas(64) double high[16], low[16];
};
inline constexpr table_of_powers powers_16 = {
    {1, 0x1.0b5586cf9890fp+0, 0x1.172b83c7d517bp+0, 0x1.2387a6e756238p+0, 0x1.306fe0a31b715p+0,
     0x1.3dea64c123422p+0, 0x1.4bfdad5362a27p+0, 0x1.5ab07dd485429p+0, 0x1.6a09e667f3bcdp+0,
     0x1.7a11473eb0187p+0, 0x1.8ace5422aa0dbp+0, 0x1.9c49182a3f09p+0, 0x1.ae89f995ad3adp+0,
     0x1.c199bdd85529cp+0, 0x1.d5818dcfba487p+0, 0x1.ea4afa2a490dap+0},
    {0, 0x1.8a62e4adc610bp-54, -0x1.19041b9d78a76p-55, 0x1.9b07eb6c70573p-54, 0x1.6f46ad23182e4p-55,
     0x1.ada0911f09ebcp-55, 0x1.d4397afec42e2p-56, 0x1.6324c054647adp-54, -0x1.bdd3413b26456p-54,
     -0x1.41577ee04992fp-55, 0x1.6e9f156864b27p-54, 0x1.c7c46b071f2bep-56, 0x1.7a1cd345dcc81p-54,
     0x1.11065895048ddp-55, 0x1.2ed02d75b3707p-55, -0x1.e9c23179c2893p-54},
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::functions
