// Helpers for the scripts of tagging rules. Evaluated in every script context before the rule.
(function () {
	var QVSearchKit = {};

	QVSearchKit.global = this;

	QVSearchKit.isDef = function (val) {
		return val !== undefined;
	};

	// Assigns opt_object at the dotted path of name, below opt_objectToExportTo or the global object.
	QVSearchKit.exportSymbol = function (name, opt_object, opt_objectToExportTo) {
		var target = opt_objectToExportTo || QVSearchKit.global;
		var dot = name.indexOf(".");
		var part = dot < 0 ? name : name.substring(0, dot);

		// Hosts whose globals can only be declared, not assigned.
		if (!(part in target) && typeof target.execScript === "function") {
			target.execScript("var " + part);
		}

		while (dot >= 0) {
			target = target[part] || (target[part] = {});
			var start = dot + 1;
			dot = name.indexOf(".", start);
			part = name.substring(start, dot < 0 ? name.length : dot);
		}
		if (opt_object !== undefined) {
			target[part] = opt_object;
		} else if (!target[part]) {
			target[part] = {};
		}
	};

	QVSearchKit.api = {};

	QVSearchKit.api.VERSION = '1.0.0';

	// The first element of parameters with that name, or null. An element with a single parameter
	// arrives as an object instead of an array; it has no length, so nothing is found in it.
	QVSearchKit.api.GetPlugInParameter = function (parameters, name) {
		if (!parameters) {
			return null;
		}
		for (var i = 0; i < parameters.length; i++) {
			if (parameters[i].name == name) {
				return parameters[i];
			}
		}
		return null;
	};

	QVSearchKit.exportSymbol("QVSearchKit.api", QVSearchKit.api);
}).call(this);
