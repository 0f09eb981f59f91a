//#-hidden-code
//#-code-completion(everything, hide)
//#-code-completion(currentmodule, show)
//#-code-completion(chapterauxiliarymodule, show)
//#-code-completion(bookauxiliarymodule, hide)
//#-code-completion(identifier, show, isMultiple(of:))
//#-code-completion(keyword, show, if, else)
//#-end-hidden-code
// Pip plants a garden at the foot of the lighthouse. It has 4 rows of 8 beds.
// The outer loop walks from row to row. In *each* row the inner loop starts
// anew and walks from bed to bed, so the inner code runs 4 times 8 times.
//
// Your turn: now there is a flower in every bed. Leave every second bed empty,
// so that the garden looks like the picture.

var garden = Garden(rows: 4, columns: 8)

for row in 0 ..< garden.rows {
    for column in 0 ..< garden.columns {
        //#-editable-code Tap to decide what grows here
        garden.plant("*", row: row, column: column)
        //#-end-editable-code
    }
}

print(garden.picture)

//#-hidden-code
check(
    garden == Garden.chessboard(rows: 4, columns: 8),
    praise: "The bees are delighted.",
    hint: "Add up row and column. Is the sum even or odd?"
)
//#-end-hidden-code
