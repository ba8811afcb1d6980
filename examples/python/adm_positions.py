"""Says where the objects of a mix are heard. Usage: adm_positions.py FILE"""

import sys

import ktfiles

for item in ktfiles.adm(sys.argv[1]).objects:
    for channel in (each for pack in item.pack_formats for each in pack.channel_formats):
        blocks = channel.blocks
        for time, position, is_cartesian in zip(blocks.times, blocks.positions, blocks.cartesian):
            names = "X Y Z".split() if is_cartesian else "azimuth elevation distance".split()
            where = ", ".join(f"{name} {value:g}" for name, value in zip(names, position))
            print(f"{item.name}: {(item.start or 0) + time:.3f} s  {where}")
