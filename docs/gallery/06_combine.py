"""Blending by a mask

Sharp where the mask is bright, blurred elsewhere. The mask is an image like any other, here computed with NumPy.
"""
import numpy as np
import skimage
import zelt

root = zelt.create("ZELT.Main2")
camera = zelt.imread(f"{skimage.data_dir}/camera.png")
blurred = root.Filters.Gauss(camera, 5.0)

y, x = np.mgrid[:512, :512]
mask = np.uint8(255 * np.clip(2 - np.hypot(x - 240, y - 140) / 80, 0, 1))
zelt.imwrite("combine_mask.png", mask)
zelt.imwrite("combine_result.png", root.Basic.Combine(blurred, camera, mask))
