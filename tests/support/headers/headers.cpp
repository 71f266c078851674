// Exists so that the headers which every test includes are compiled once.
