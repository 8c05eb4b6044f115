"""Dark and gain correction

A simulated camera with dust, dark corners and dead pixels looked at a photograph (`zelt demo`). The mean of its dark frames
is taken away, and each pixel is multiplied by the gain that makes the mean of its flat frames even. Left the exposure less its dark frame, right
the corrected one.
"""
import numpy as np
import zelt

root = zelt.create("ZELT.Main2")


def mean_of(name):
    files = [f"zelt-demo/{name}_{n}.tif" for n in range(1, 9)]
    frames = [np.asarray(zelt.imread(file)) for file in files]
    return np.mean(frames, axis=0, dtype=np.float32)


frame = np.float32(zelt.imread("zelt-demo/raw.tif"))
dark, flat = mean_of("dark"), mean_of("flat")
gain = np.zeros_like(flat)
root.FlatFielding.ToGainRef(gain, flat - dark)
corrected = root.FlatFielding.FlattenEx(frame, "Float", dark, gain)

# 14-bit counts as bytes for the page.
both = np.hstack([frame - dark, corrected])
picture = zelt.image(np.zeros(both.shape, np.uint8))
root.Conversions.Recode(picture, root.Basic.Multiply(both, 255 / 10000))
zelt.imwrite("correction_before_after.png", picture)
