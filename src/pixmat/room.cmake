find_library(ZELT_SLEEF sleef REQUIRED)
zelt_room_uses(pixmat ${ZELT_SLEEF})
