//#-code-completion(everything, hide)
//#-code-completion(identifier, show, row, height, sail)
//#-code-completion(literal, show, integer)
//#-hidden-code
var sails: [String] = []
//#-end-hidden-code
// The inner loop may depend on the outer one. This sail is narrow at the top
// and grows by one star with each row:
//
//     *
//     **
//     ***
//
// Your turn: how many stars does a row have? Then sew a sail as high as you like.

let height = /*#-editable-code height of the sail*/5/*#-end-editable-code*/

for row in 1 ... height {
    var sail = ""
    for _ in 1 ... /*#-editable-code*/height/*#-end-editable-code*/ {
        sail += "*"
    }
    print(sail)
    //#-hidden-code
    sails.append(sail)
    //#-end-hidden-code
}

//#-hidden-code
check(
    sails.map(\.count) == Array(1 ... height),
    praise: "The wind is in your sail!",
    hint: "Row 1 has one star, row 2 has two, and row 3 has three."
)
//#-end-hidden-code
