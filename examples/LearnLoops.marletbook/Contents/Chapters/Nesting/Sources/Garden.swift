/// A garden of flower beds in rows and columns, both counted from 0.
public struct Garden: Equatable {
    public let rows: Int
    public let columns: Int

    private var beds: [[Character]]

    /// Makes a garden of empty beds.
    public init(rows: Int, columns: Int) {
        self.rows = rows
        self.columns = columns
        beds = Array(repeating: Array(repeating: ".", count: columns), count: rows)
    }

    /// A garden in which every second bed has a flower, as on a chessboard.
    public static func chessboard(rows: Int, columns: Int) -> Garden {
        var garden = Garden(rows: rows, columns: columns)
        for row in 0 ..< rows {
            for column in 0 ..< columns where (row + column).isMultiple(of: 2) {
                garden.plant("*", row: row, column: column)
            }
        }
        return garden
    }

    /// Plants a flower in one bed, in place of what grew there.
    public mutating func plant(_ flower: Character, row: Int, column: Int) {
        beds[row][column] = flower
    }

    /// The garden as seen from the top of the lighthouse, one line for each row.
    public var picture: String {
        beds.map { String($0) }.joined(separator: "\n")
    }
}
