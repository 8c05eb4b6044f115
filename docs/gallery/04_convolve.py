"""Sharpening by convolution

A kernel is an array of shape (height, width); the two numbers behind it are the anchor (x, y). Left the contrast is
stretched first, between the darkest and brightest half percent.
"""
import numpy as np
import skimage
import zelt

root = zelt.create("ZELT.Main2")
moon = zelt.imread(f"{skimage.data_dir}/moon.png")

stretched = root.Basic.Normalize(moon, 0.005, 0.995)
zelt.imwrite("moon_stretched.png", stretched)

sharpen = np.array([[0, -1, 0], [-1, 5, -1], [0, -1, 0]], float)
zelt.imwrite("moon_sharpened.png", root.Filters.Convolve(stretched, sharpen, 1, 1))
