/// The weather in each harbour this morning, from north to south.
public let morningReports = ["☀️", "🌧️", "⛈️", "☀️", "🌫️"]
