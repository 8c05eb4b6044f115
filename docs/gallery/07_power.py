"""Brightening the dark parts

A square root of the pixels, which `Basic.Power` takes of float images.
"""
import numpy as np
import skimage
import zelt

root = zelt.create("ZELT.Main2")
cell = zelt.imread(f"{skimage.data_dir}/cell.png")

zelt.imwrite("power_input.png", cell)
root_of = root.Basic.Power(np.float32(cell), 0.5)
stretched = root.Basic.Multiply(root_of, 255 / root.Statistics.Maximum(root_of))
picture = zelt.image(np.zeros(stretched.shape, np.uint8))
root.Conversions.Recode(picture, stretched)
zelt.imwrite("power_half.png", picture)
