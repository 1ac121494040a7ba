// The software instruments of a patch that are switched on, one tag for each, by the names of their plug-ins.
var instruments = [
	"Beatforge", "Bellwrithe", "Brassolith", "Clavonne", "Corvane", "Drumquarry", "Fathomer",
	"Grainweft", "Hammerlyn", "Modelith", "Orgalisk", "Percuvane", "Quartzine", "Reedmarrow",
	"Slicelorn", "Stepwarden", "Stringarth", "Tinewick", "Vocarra", "Vorthal", "ZS E", "ZS M",
	"ZS P"
];

function main() {
	var tags = [];
	for (var i = 0; i < instruments.length; i++) {
		var path = "/Patch/Channels/Channel/Plugins/Plugin[@bypassed=0 and @name='" + instruments[i] + "']";
		if (document.isMatchingXPath(path)) {
			tags.push({"label": instruments[i]});
		}
	}

	if (tags.length > 0) {
		return tags;
	}
}
