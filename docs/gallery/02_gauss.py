"""Gaussian blur

Sigma 1.5 and 6. The filter is recursive: any sigma takes the same time.
"""
import skimage
import zelt

root = zelt.create("ZELT.Main2")
coins = zelt.imread(f"{skimage.data_dir}/coins.png")

zelt.imwrite("gauss_input.png", coins)
zelt.imwrite("gauss_1.5.png", root.Filters.Gauss(coins, 1.5))
zelt.imwrite("gauss_6.png", root.Filters.Gauss(coins, 6.0))
