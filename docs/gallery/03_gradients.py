"""Edges

`Sobel` of a byte image stops at 255. `GaussDerivative` smooths first; of a float image it keeps all values, which are then
stretched for the page.
"""
import numpy as np
import skimage
import zelt

root = zelt.create("ZELT.Main2")
camera = zelt.imread(f"{skimage.data_dir}/camera.png")

zelt.imwrite("edges_sobel.png", root.Filters.Sobel(camera))

edges = root.Filters.GaussDerivative(np.float32(camera), 2.0)
stretched = root.Basic.Multiply(edges, 255 / root.Statistics.Maximum(edges))
picture = zelt.image(np.zeros(stretched.shape, np.uint8))
root.Conversions.Recode(picture, stretched)
zelt.imwrite("edges_gauss_derivative.png", picture)
