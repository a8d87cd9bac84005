# The layer order, lowest first: a folder's code includes its own folder and
# the folders of lower layers, never a sibling or anything above. The host
# program sees the framework (the plug-in interface is part of it) and
# itself. tools/, bench/ and tests/ may use anything.
set(ARCHWAY_LAYERS "framework" "lens gpu resources" "params" "solver" "filter" "workspace")
set(ARCHWAY_HOST_SEES framework host)
