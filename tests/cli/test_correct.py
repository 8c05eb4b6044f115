"""zelt correct against the same arithmetic in NumPy, and against the physics of a camera."""

import json

import numpy as np
import pytest
import tifffile
from PIL import Image

from conftest import pixels, write_fits

RANDOM = np.random.RandomState


def save(zelt, **images):
    for name, image in images.items():
        tifffile.imwrite(zelt.folder / f"{name}.tif", image)


def correct(zelt, *arguments):
    zelt("correct", *arguments, "-o", "out.tif")
    return tifffile.imread(zelt.folder / "out.tif")


def half_away(values):
    return np.floor(np.abs(values) + 0.5) * np.sign(values)


def frames(shape=(37, 53), depth=16, seed=3):
    """Exposure, two dark and two flat frames, with dead, saturated and darker-than-dark pixels."""
    random, top = RANDOM(seed), 2**depth - 1
    dark = [random.randint(90, 130, shape).astype("u2") for _ in range(2)]
    flat = [(dark[i] + random.randint(top // 8, top // 2, shape)).astype("u2") for i in range(2)]
    raw = random.randint(0, top + 1, shape).astype("u2")
    for image in flat:
        image[0, 0], image[0, 1] = 95, 0
    raw[1, :4] = [0, top, 89, 131]
    return raw, dark, flat


def even_mean(images):
    return np.rint(sum(i.astype(np.float64) for i in images) / len(images)).astype(np.int64)


@pytest.mark.parametrize("dtype", ["u1", "u2", "u4", "i1", "i2", "i4", "f4", "f8"])
def test_dark_frames_are_averaged_exactly(zelt, dtype):
    darks = [pixels((9, 11), dtype, seed) // 8 for seed in range(3)]
    raw = np.full((9, 11), 1 if dtype[0] == "f" else np.iinfo(dtype).max, dtype)
    save(zelt, raw=raw, stack=np.array(darks[1:]), dark=darks[0])
    out = correct(zelt, "raw.tif", "--dark", "dark.tif", "stack.tif", "--no-gain", "--float")
    if dtype in ("u1", "u2"):  # dark references of such frames are whole numbers
        expected = (raw.astype(int) - even_mean(darks)).astype("f4")
    else:
        real = np.float32 if dtype in ("i1", "i2", "f4") else np.float64
        expected = raw.astype(real) - (sum(d.astype(np.float64) for d in darks) / 3).astype(real)
    assert out.dtype == expected.dtype and np.array_equal(out, expected)


def test_without_a_gain_pixels_below_the_dark_become_zero(zelt):
    raw, dark, _ = frames()
    for dtype in "u2", "u1":
        save(zelt, raw=raw.astype(dtype), dark=dark[0].astype(dtype))
        out = correct(zelt, "raw.tif", "--dark", "dark.tif", "--no-gain")
        difference = raw.astype(dtype).astype(int) - dark[0].astype(dtype)
        assert out.dtype == dtype and np.array_equal(out, np.maximum(difference, 0)), dtype


def real_gain(dark, flat, norm=None):
    light = (even_mean(flat) - even_mean(dark)).astype("f4")
    norm = light.astype("f8").mean() if norm is None else norm
    with np.errstate(divide="ignore"):
        gain = np.minimum(norm / light.astype("f8"), 50)
    return light, np.where(light > 0, gain, 50).astype("f4")


@pytest.mark.parametrize("bits", [12, 16])
def test_float_gain_rounds_limits_and_never_wraps(zelt, bits):
    raw, dark, flat = frames(depth=bits)
    save(zelt, raw=raw, d1=dark[0], d2=dark[1], f1=flat[0], f2=flat[1])
    references = ["--dark", "d1.tif", "d2.tif", "--flat", "f1.tif", "f2.tif", "--bits", bits]
    _, gain = real_gain(dark, flat)
    exact = (raw.astype(int) - even_mean(dark)).astype("f4") * gain
    out = correct(zelt, "raw.tif", *references)
    assert out.dtype == "u2" and np.array_equal(out, np.clip(half_away(exact), 0, 2**bits - 1))
    assert gain[0, 0] == 50 and (out == 2**bits - 1).any() and (exact < 0).any()
    with tifffile.TiffFile(zelt.folder / "out.tif") as file:  # where the nominal depth is kept
        assert ("Unsigned 12" in file.pages[0].description) == (bits == 12)
    assert np.array_equal(correct(zelt, "raw.tif", *references, "--float"), exact)
    _, doubled = real_gain(dark, flat, 2000.0)
    out = correct(zelt, "raw.tif", *references, "--float", "--norm", "2000")
    assert np.array_equal(out, (raw.astype(int) - even_mean(dark)).astype("f4") * doubled)


def test_fixed_gain_is_exact_integer_arithmetic_without_wrapping(zelt):
    raw, dark, flat = frames(depth=12)
    save(zelt, raw=raw, d1=dark[0], d2=dark[1], f1=flat[0], f2=flat[1])
    light = np.maximum(even_mean(flat) - even_mean(dark), 0)
    norm = (even_mean(flat) - even_mean(dark)).astype("f8").mean()
    for scale in 0, 1, 4:
        with np.errstate(divide="ignore"):
            gain = np.floor(np.minimum(norm * 65536 / (light.astype("f8") * 2**scale), 65535) + 0.5)
        product = np.maximum(raw.astype(int) - even_mean(dark), 0) * gain.astype(int) >> (16 - scale)
        out = correct(zelt, "raw.tif", "--dark", "d1.tif", "d2.tif", "--flat", "f1.tif", "f2.tif", "--bits", "12",
                      "--gain", "fixed", "--scale", scale)
        assert np.array_equal(out, np.minimum(product, 4095)), scale


@pytest.mark.parametrize("dtype", ["u1", "i2", "u4", "f4", "f8"])
def test_other_pixel_types_are_corrected_in_float(zelt, dtype):
    random, real = RANDOM(5), np.float64 if dtype in ("u4", "f8") else np.float32
    high = {"u1": 200, "i2": 20000}.get(dtype, 60000)
    raw, flat = (random.randint(high // 2, high, (20, 30)).astype(dtype) for _ in range(2))
    save(zelt, raw=raw, dark=np.full((20, 30), 7, dtype), flat=flat)
    light = flat.astype("f8") - 7
    gain = np.minimum(light.mean() / light, 50).astype(real)
    exact = (raw.astype(real) - real(7)) * gain
    if dtype[0] != "f":
        exact = np.clip(half_away(exact), np.iinfo(dtype).min, np.iinfo(dtype).max)
    out = correct(zelt, "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif")
    assert out.dtype == dtype and np.array_equal(out, exact.astype(dtype))


@pytest.mark.parametrize("with_gain", [True, False])
def test_short_exposure_stands_in_for_saturated_pixels(zelt, with_gain):
    _, dark, flat = frames(depth=12)
    scene = RANDOM(1).randint(0, 9000, dark[0].shape)
    long, short = np.minimum(scene + 100, 4095).astype("u2"), (scene // 8 + 100).astype("u2")
    write_fits(zelt.folder / "long.fits", long)
    write_fits(zelt.folder / "short.fits", short)
    save(zelt, d=dark[0], f=flat[0])
    gain = real_gain(dark[:1], flat[:1])[1] if with_gain else np.ones(long.shape, "f4")
    from_long = np.floor((long.astype(int) - dark[0]).astype("f4") * gain + np.float32(0.5))
    from_short = np.trunc((short.astype(int) - dark[0]) * 8.0 * gain.astype("f8"))
    text = zelt("correct", "long.fits", "--short", "short.fits", "--ratio", "8", "--dark", "d.tif", "--bits", "12",
                *(["--flat", "f.tif"] if with_gain else ["--no-gain"]), "-o", "out.tif")
    out = tifffile.imread(zelt.folder / "out.tif")
    assert out.dtype == "i4" and np.array_equal(out, np.where(long == 4095, from_short, from_long))
    assert f"stands in for {(long == 4095).sum()} pixels" in text


def test_error_falls_to_what_noise_alone_makes(zelt):
    random, shape, count = RANDOM(11), (200, 300), 6
    y, x = np.mgrid[-1:1:200j, -1:1:300j]
    response = (1 - 0.25 * (x * x + y * y)) * (1 + 0.03 * random.standard_normal(shape))
    offset = 300 + 40 * random.random_sample(shape)
    expose = lambda light: np.rint(random.poisson(light * response) + offset + 3 * random.standard_normal(shape)).astype("u2")
    scene = 3000 + 2500 * np.sin(9 * x + 5 * y)
    save(zelt, raw=expose(scene), dark=np.array([expose(0 * scene) for _ in range(count)]),
         flat=np.array([expose(0 * scene + 20000) for _ in range(count)]))
    truth = scene * response.mean()
    error = lambda image: np.sqrt(np.mean((image - truth) ** 2))
    # Shot and read noise of the exposure, of the means of dark and flat frames, and rounding, through the gain.
    gain, read = response.mean() / response, 9 + 1 / 12
    dark = read / count + 1 / 12
    noise = gain**2 * (scene * response + read + dark)
    noise += truth**2 * ((20000 * response + read) / count + 1 / 12 + dark) / (20000 * response) ** 2 + 1 / 12
    before = error(tifffile.imread(zelt.folder / "raw.tif") - offset.mean())
    after = error(correct(zelt, "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif"))
    tolerance = 0.02  # 60000 pixels: the spread of an rms is 0.3 %
    assert abs(after / np.sqrt(noise.mean()) - 1) < tolerance and before > 5 * after, (before, after)


def test_numbers_are_those_of_the_images(zelt):
    raw, dark, flat = frames((60, 80))
    shade = np.linspace(0.2, 1, 80)
    flat = [(d + shade * (f - np.minimum(f, d) + 9000)).astype("u2") for d, f in zip(dark, flat)]
    save(zelt, raw=raw, dark=np.array(dark), flat=np.array(flat))
    said = json.loads(zelt("correct", "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif", "-o", "out.tif", "--json"))
    light, _ = real_gain(dark, flat)
    lit = light > np.sort(light.ravel())[round(0.999 * (light.size - 1))] / 2
    by_lit = json.loads(zelt("correct", "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif", "-o", "lit.tif", "--json",
                             "--norm", "lit"))
    assert np.isclose(by_lit["gain"]["norm"], light[lit].mean(dtype="f8"), rtol=1e-12)
    assert 0.1 < lit.mean() < 0.9 and said["flat"]["lit"] == lit.mean() and said["flat"]["frames"] == 2
    out = tifffile.imread(zelt.folder / "out.tif")

    def around(image, y, x):
        window = np.s_[max(0, y - 15):y + 16, max(0, x - 15):x + 16]
        return image[window][lit[window]].mean()

    shown = said["exposures"][0]
    for numbers, image, less_dark in ((shown["raw"], raw, raw - even_mean(dark)), (shown["corrected"], out, out)):
        fine = np.array([less_dark[y, x] / around(less_dark, y, x) for y, x in zip(*np.nonzero(lit))])
        expected = [image.mean(), image.min(), image.max(), image.std(), less_dark[lit].std() / less_dark[lit].mean(),
                    fine.std() / fine.mean()]
        found = [numbers[k] for k in ("mean", "minimum", "maximum", "standard_deviation", "uneven", "fine_uneven")]
        assert np.allclose(found, expected, rtol=1e-9)
    # The check on a flat frame corrects the first with a gain that comes from the second alone.
    light, gain = real_gain(dark, flat[1:])
    lit = light > np.sort(light.ravel())[round(0.999 * (light.size - 1))] / 2
    first = (flat[0] - even_mean(dark)).astype("f4")
    for image, part in ((first, "before"), (first * gain, "after")):
        assert np.isclose(said["flat"][part]["uneven"], image[lit].std(dtype="f8") / image[lit].mean(dtype="f8"), rtol=1e-5)
    assert said["flat"]["after"]["uneven"] != said["flat"]["before"]["uneven"]


def test_one_flat_frame_is_not_checked_against_itself(zelt):
    raw, dark, flat = frames()
    save(zelt, raw=raw, dark=dark[0], flat=flat[0])
    said = json.loads(zelt("correct", "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif", "-o", "out.png", "--json"))
    assert said["flat"]["before"]["uneven"] is None and said["flat"]["after"]["uneven"] is None
    with Image.open(zelt.folder / "out.png") as png:
        assert np.asarray(png).mean() == pytest.approx(said["exposures"][0]["corrected"]["mean"])


def test_evenness_can_be_looked_at_in_an_area(zelt):
    raw, dark, flat = frames((40, 40))
    raw[:] = 30000
    raw[:10] = 50000
    save(zelt, raw=raw, dark=np.full((40, 40), 100, "u2"), flat=np.full((40, 40), 20100, "u2"))
    for area, expected in (("0,10,40,40", 0.0), ("0,0,40,20", 10000 / 39900)):
        said = json.loads(zelt("correct", "raw.tif", "--dark", "dark.tif", "--flat", "flat.tif", "-o", "out.tif", "--json",
                               "--area", area))
        assert said["exposures"][0]["corrected"]["uneven"] == pytest.approx(expected), area
