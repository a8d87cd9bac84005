#!/usr/bin/env bash
# Rewrites the generated seeds of the fuzz corpora in tests/fuzz/corpus from
# the project's own writers: small generated photographs (64 x 48) and their
# actions, the descriptors, constraint blobs, XMP packets and image layouts
# made from them, preferences as the filter saves them, the lens profiles in
# resources/profiles and the module's resource table, bare and in an ELF
# file. Hand-written seeds and kept regression inputs are left alone.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
cmake --preset fuzz >/dev/null
cmake --build build/fuzz --target fuzz_seed_maker archway-synth archway_resources

corpus=tests/fuzz/corpus
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
synth() { build/fuzz/tools/synth/archway-synth --size 64x48 --samples 1 "$@"; }

synth -o "$work/room.tif" --action "$work/room.action"
synth --projection fisheye-equisolid --focal-mm 8 -o "$work/room-fisheye.tif" \
  --action "$work/room-fisheye.action"
synth --scene segments --depth 16 --gray -o "$work/segments-gray16.tif" \
  --action "$work/segments.action"
synth --scene facade --mode cmyk -o "$work/facade-cmyk.tif" --action-lines 4 \
  --action "$work/facade.action"
synth --scene checker --mode lab -o "$work/checker-lab.tif"
synth --size 64x32 --projection equirectangular -o "$work/panorama.tif"
synth --projection tangential -o "$work/room-tangential.png"
synth --depth 16 -o "$work/room-rgb16.png"
synth --gray -o "$work/room-gray.jpg"
# The room of the quick start at full size carries many lines.
build/fuzz/tools/synth/archway-synth --size 300x200 --samples 1 \
  --projection fisheye-equisolid --focal-mm 10 -o "$work/big-room.tif" \
  --action "$work/room-many-lines.action"

# The hand-written action with every item type gives its descriptor too.
cp "$corpus/action_file/all-types.action" "$work/"
build/fuzz/tests/fuzz/fuzz_seed_maker "$corpus" "$work"/*.action -- \
  "$work"/room.tif "$work"/room-fisheye.tif "$work"/segments-gray16.tif "$work"/facade-cmyk.tif \
  "$work"/checker-lab.tif "$work"/panorama.tif "$work"/*.png "$work"/*.jpg
# The generator's own files, with their EXIF and deflate compression.
for file in room.tif facade-cmyk.tif; do cp "$work/$file" "$corpus/tiff/synth-${file%.tif}.tif"; done
cp "$work/room-tangential.png" "$corpus/png/synth-room-tangential.png"
cp "$work/room-gray.jpg" "$corpus/jpeg/synth-room-gray.jpg"

# The framework's PNG decoder starts from the host's PNG layouts.
mkdir -p "$corpus/icon_png"
for file in palette-transparent gray-alpha-interlaced rgba16-interlaced room rgb-transparent-colour; do
  cp "$corpus/png/$file.png" "$corpus/icon_png/"
done

mkdir -p "$corpus/lens_profile"
cp resources/profiles/*.xmp "$corpus/lens_profile/"

blob=build/fuzz/resources/ArchwayResources.bin
mkdir -p "$corpus/resource_table" "$corpus/module_file"
cp "$blob" "$corpus/resource_table/module-resources.bin"
# The smallest ELF file that carries the section: an empty object with it.
printf '' | cc -c -x c - -o "$work/empty.o"
objcopy --add-section "archway_res=$blob" --set-section-flags archway_res=contents,readonly,data \
  "$work/empty.o" "$work/module.o"
strip --strip-all -R .comment -R .note.GNU-stack "$work/module.o" -o "$corpus/module_file/module.o"
echo "fuzz-seeds: $(find "$corpus" -type f | wc -l) files, $(du -sh "$corpus" | cut -f1)"
