"""Threshold over an uneven background

One limit for the whole image loses the dark coins. A wide Gaussian is the background; what stands 12 above it is a coin.
Differences are taken in float, where they may be negative.
"""
import numpy as np
import skimage
import zelt

root = zelt.create("ZELT.Main2")
coins = zelt.imread(f"{skimage.data_dir}/coins.png")

zelt.imwrite("coins_one_limit.png", root.Basic.Threshold(coins, 107, 0, 107, 255))

values = np.float32(coins)
above = root.Basic.Subtract(values, root.Filters.Gauss(values, 40.0))
mask = root.Basic.Threshold(root.Filters.Gauss(above, 2.0), 12, 0, 12, 255)
picture = zelt.image(np.zeros(mask.shape, np.uint8))
root.Conversions.Recode(picture, mask)
zelt.imwrite("coins_above_background.png", picture)
