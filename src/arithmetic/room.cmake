# Functions that are the same on every processor.
find_library(ZELT_SLEEF sleef REQUIRED)
zelt_room_uses(arithmetic ${ZELT_SLEEF})
