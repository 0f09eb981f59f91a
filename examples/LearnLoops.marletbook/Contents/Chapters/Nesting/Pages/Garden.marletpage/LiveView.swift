// The picture beside the page: the garden that Pip dreams of.
let dream = Garden.chessboard(rows: 4, columns: 8)

print("Pip's dream garden:")
print(dream.picture)
