// Not in the list either, and before "Fog", since those pages are sorted by name.
print("The sun is down.")
